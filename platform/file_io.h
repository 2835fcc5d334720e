// File access for the engine: whole-file reads and crash-safe replacement.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/status.h"

namespace cx {

bool FileExists(const std::string& path);
// Size in bytes, or -1 when the file cannot be examined.
int64_t FileSize(const std::string& path);
// Reads the whole file; false when it cannot be opened or read.
bool ReadWholeFile(const std::string& path, std::vector<uint8_t>& out);
// Reads up to `length` bytes starting at `offset`; returns the bytes read
// (fewer at end of file) or -1 when the file cannot be opened or read.
int64_t ReadFileRange(const std::string& path, uint64_t offset, size_t length, uint8_t* out);
// A whole file read into memory that is given back to the system in large
// pages where it can be: big databases are read in one go, and faulting in
// their pages one by one costs more than reading them.
class FileBuffer {
 public:
  FileBuffer() = default;
  ~FileBuffer();
  FileBuffer(const FileBuffer&) = delete;
  FileBuffer& operator=(const FileBuffer&) = delete;

  // False when the file cannot be opened or read (the buffer is then empty).
  bool Read(const std::string& path);
  const uint8_t* data() const { return data_; }
  size_t size() const { return size_; }

 private:
  uint8_t* data_ = nullptr;
  size_t size_ = 0;
  size_t mapped_ = 0;
};

bool RemoveFile(const std::string& path);
// Names of the regular files in `dir` (not recursive), unsorted.
std::vector<std::string> ListFiles(const std::string& dir);
bool MakeDirectories(const std::string& dir);

// Writes a new version of a file without ever damaging the old one: the
// bytes go to a temporary file in the same folder, which is flushed to disk
// and then renamed over the target. Until Commit() succeeds the target is
// untouched; destroying an uncommitted writer removes the temporary file.
class SafeFileWriter {
 public:
  // `sync` false leaves out the flushes to disk: the old file is still
  // replaced only by a complete new one, but a power failure right after
  // may lose the new one. For text exports, which can be made again.
  explicit SafeFileWriter(std::string target, bool sync = true);
  ~SafeFileWriter();
  SafeFileWriter(const SafeFileWriter&) = delete;
  SafeFileWriter& operator=(const SafeFileWriter&) = delete;

  Status Open();
  // Buffered; a failure is remembered and reported by Commit().
  bool Write(const void* data, size_t size);
  Status Commit();
  void Abandon();
  bool failed() const { return failed_; }

 private:
  bool Flush();
  bool WriteAll(const uint8_t* p, size_t size);

  std::string target_;
  std::string temp_;
  int fd_ = -1;
  bool sync_ = true;
  bool failed_ = false;
  std::string error_;
  std::vector<uint8_t> buffer_;
};

// Writes a whole small file safely (as above).
Status WriteFileSafely(const std::string& path, const void* data, size_t size);

}  // namespace cx
