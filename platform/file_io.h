// File access for the engine: whole-file reads and crash-safe replacement.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/status.h"

namespace cx {

// What identifies one state of a file on disk: a file replaced, rewritten
// or touched by anyone since differs in at least one of these.
struct FileState {
  uint64_t device = 0;
  uint64_t inode = 0;
  int64_t size = 0;
  int64_t modifiedSeconds = 0;
  int64_t modifiedNanoseconds = 0;
  bool operator==(const FileState&) const = default;
};

// The state of the file `path` leads to (symbolic links followed); nothing
// when there is no such file.
std::optional<FileState> StatFile(const std::string& path);

bool FileExists(const std::string& path);
// Size in bytes, or -1 when the file cannot be examined.
int64_t FileSize(const std::string& path);
// The reading functions below open regular files only: a FIFO or a device
// given where a file is expected fails at once instead of blocking.
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
  // kCopy reads the bytes into memory of the process's own. kMap maps the
  // file's cached pages instead, which costs neither fresh memory nor a
  // copy; but a program that rewrites the file in place while it is mapped
  // changes these bytes too, and one that shortens it makes reading past
  // its new end raise SIGBUS. Only for processes that live a moment and
  // hold the file's lock (the command-line tool); an empty file, or one
  // that cannot be mapped, is read as with kCopy.
  enum class Access { kCopy, kMap };

  FileBuffer() = default;
  ~FileBuffer();
  FileBuffer(const FileBuffer&) = delete;
  FileBuffer& operator=(const FileBuffer&) = delete;

  // False when the file cannot be opened or read (the buffer is then empty).
  bool Read(const std::string& path, Access access = Access::kCopy);
  const uint8_t* data() const { return data_; }
  size_t size() const { return size_; }
  // The file's state when it was read.
  const FileState& state() const { return state_; }

 private:
  uint8_t* data_ = nullptr;
  size_t size_ = 0;
  size_t mapped_ = 0;
  FileState state_;
};

// Follows symbolic links from `path` to the name of the file they end at
// (which need not exist yet); `path` itself when it is no link. False for
// a loop of links or one that cannot be read.
bool ResolveLinks(const std::string& path, std::string& resolved);

bool RemoveFile(const std::string& path);
// Names of the regular files in `dir` (not recursive), unsorted.
std::vector<std::string> ListFiles(const std::string& dir);
bool MakeDirectories(const std::string& dir);

// Writes a new version of a file without ever damaging the old one: the
// bytes go to a temporary file in the same folder as the real file (links
// are followed, so a link keeps pointing at the new version), which is
// flushed to disk and then renamed over it. Until Commit() succeeds the
// target is untouched; destroying an uncommitted writer removes the
// temporary file.
//
// The temporary file has the target's permissions, owner and group from
// its creation (owner and group where the process may set them), so a
// private file is never readable by others, not even for a moment. A file
// with no write permission for this user (or no write bit at all, which
// holds even for the administrator) is not replaced. Temporary files that
// an earlier save of the same file left behind when its process died are
// removed.
class SafeFileWriter {
 public:
  struct Options {
    // False leaves out the flushes to disk: the old file is still replaced
    // only by a complete new one, but a power failure right after may lose
    // the new one. For text exports, which can be made again.
    bool sync = true;
    // An existing target that is not a regular file (a FIFO, a terminal, a
    // device) is written into directly rather than replaced by a file.
    bool writeIntoSpecialFiles = false;
  };

  explicit SafeFileWriter(std::string target, bool sync = true);
  SafeFileWriter(std::string target, Options options);
  ~SafeFileWriter();
  SafeFileWriter(const SafeFileWriter&) = delete;
  SafeFileWriter& operator=(const SafeFileWriter&) = delete;

  Status Open();
  // Buffered; a failure is remembered and reported by Commit().
  bool Write(const void* data, size_t size);
  // For a file whose beginning is known last (a regular file only): the
  // Write()s after SkipTo go on from `offset`, and WriteAt fills in what
  // lies before it. Failures as for Write().
  bool SkipTo(uint64_t offset);
  bool WriteAt(uint64_t offset, const void* data, size_t size);
  Status Commit();
  void Abandon();
  bool failed() const { return failed_; }
  // After a successful Commit() into a regular file: the new file's state.
  const std::optional<FileState>& written() const { return written_; }
  // The temporary file being written (empty when writing directly).
  const std::string& temporaryPath() const { return temp_; }

 private:
  bool Flush();
  bool WriteAll(const uint8_t* p, size_t size);
  Status Fail(const std::string& what);

  std::string target_;    // as the caller named it, for messages
  std::string real_;      // where the links lead
  std::string temp_;
  int fd_ = -1;
  bool direct_ = false;
  bool replacing_ = false;  // a file of the target's name exists
  Options options_;
  bool failed_ = false;
  std::string error_;
  std::vector<uint8_t> buffer_;
  uint64_t writtenBytes_ = 0;
  uint64_t startedBytes_ = 0;  // sent on to the disk up to here
  std::optional<FileState> written_;
};

// True when `name` (a file name without folder) is a temporary file that a
// SafeFileWriter makes while replacing `targetName` in the same folder.
bool IsTemporaryNameFor(const std::string& targetName, const std::string& name);

// An advisory lock on a file, held until Release() or destruction, so that
// cooperating processes take turns at an open-change-save of it. Other
// programs may ignore it; the saving side's check of the file's state
// guards against those.
class FileLock {
 public:
  FileLock() = default;
  ~FileLock() { Release(); }
  FileLock(const FileLock&) = delete;
  FileLock& operator=(const FileLock&) = delete;

  // Readers share a file; one that changes it holds it alone.
  enum class Kind { kExclusive, kShared };

  // Waits up to `timeoutMs` for the lock on the regular file `path` leads
  // to. A name that does not exist or is not a regular file is not locked
  // and not an error (held() then tells): there is nothing to protect yet.
  Status Acquire(const std::string& path, int timeoutMs, Kind kind = Kind::kExclusive);
  void Release();
  bool held() const { return fd_ >= 0; }
  // The locked file (device and inode), to recognise a second name of it.
  const FileState& state() const { return state_; }

 private:
  int fd_ = -1;
  FileState state_;
};

// Writes a whole small file safely (as above).
Status WriteFileSafely(const std::string& path, const void* data, size_t size);

}  // namespace cx
