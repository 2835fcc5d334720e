// Sequential reader of the records of a database file. The file is read
// into memory once; records are handed out as views into that image, which
// callers may keep (the image is shared).
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "engine/container.h"
#include "platform/file_io.h"

namespace cx {

using FileImage = std::shared_ptr<const FileBuffer>;
// The bytes the records are read from, and whatever keeps them alive: the
// whole file, or only its first part when the data records are not wanted.
struct RecordSource {
  std::shared_ptr<const void> owner;
  std::span<const uint8_t> bytes;
};

class RecordReader {
 public:
  // OpenRecordReader: reads the file and the `count` entries at
  // `listOffset`. False when the file cannot be read or the entry list does
  // not fit in it.
  bool Open(const std::string& path, size_t count, size_t listOffset = format::kListOffset);
  bool Open(FileImage image, size_t count, size_t listOffset = format::kListOffset);
  // Over the first part of a file only: records beyond it cannot be read.
  bool Open(RecordSource source, size_t count, size_t listOffset = format::kListOffset);

  // NextRecord: the next record's bytes, attributes and unique id. A record
  // runs to the next entry's offset; the last one to the end of the file,
  // cut to 65535 bytes. False when the entries are used up or the record
  // cannot be read (offset past the end of the file, offsets out of order,
  // a record of more than 65535 bytes).
  bool Next(std::span<const uint8_t>& bytes, uint8_t& attributes, uint32_t& uniqueID);

  size_t index() const { return next_; }
  // True when the last record was longer than 65535 bytes and was cut.
  bool lastRecordCut() const { return lastCut_; }
  size_t count() const { return entries_.size(); }
  const std::shared_ptr<const void>& owner() const { return source_.owner; }
  const std::vector<RecordEntry>& entries() const { return entries_; }

 private:
  RecordSource source_;
  std::vector<RecordEntry> entries_;
  size_t next_ = 0;
  bool lastCut_ = false;
};

// Reads record `index` of a database file without loading the database.
// The index must be below the file's record count and the record smaller
// than 65535 bytes; nothing otherwise.
bool ReadRecordAt(const std::string& path, size_t index, std::vector<uint8_t>& out);

// Copies record `index` of a database file to `outPath`, without its final
// byte (files made this way have always been one byte short, and the
// receiving side expects exactly that). 1 on success, 0 on failure.
int CopyRecordToFile(const std::string& databasePath, size_t index, const std::string& outPath);

}  // namespace cx
