#include "engine/record_reader.h"

#include "platform/file_io.h"

namespace cx {

bool RecordReader::Open(const std::string& path, size_t count, size_t listOffset) {
  auto bytes = std::make_shared<FileBuffer>();
  if (!bytes->Read(path)) return false;
  return Open(std::move(bytes), count, listOffset);
}

bool RecordReader::Open(FileImage image, size_t count, size_t listOffset) {
  RecordSource source;
  if (image) source.bytes = std::span<const uint8_t>(image->data(), image->size());
  source.owner = std::move(image);
  return Open(std::move(source), count, listOffset);
}

bool RecordReader::Open(RecordSource source, size_t count, size_t listOffset) {
  source_ = std::move(source);
  entries_.clear();
  next_ = 0;
  const std::span<const uint8_t> file = source_.bytes;
  if (listOffset > file.size() || count > (file.size() - listOffset) / format::kEntrySize) {
    return false;
  }
  entries_.reserve(count);
  for (size_t i = 0; i < count; ++i) {
    entries_.push_back(DecodeEntry(file.data() + listOffset + i * format::kEntrySize));
  }
  return true;
}

bool RecordReader::Next(std::span<const uint8_t>& bytes, uint8_t& attributes, uint32_t& uniqueID) {
  if (next_ >= entries_.size()) return false;
  const RecordEntry& e = entries_[next_];
  const size_t fileSize = source_.bytes.size();
  ++next_;
  if (e.offset > fileSize) return false;
  size_t size;
  if (next_ < entries_.size()) {
    uint32_t end = entries_[next_].offset;
    if (end < e.offset || end > fileSize) return false;
    size = end - e.offset;
    // As large as the last record may be, so that a record moved by a sort
    // from the end of a file is read back from the middle of the next one.
    if (size > format::kMaxRecordSize) return false;
  } else {
    size = fileSize - e.offset;
    if (size > format::kMaxRecordSize) {
      size = format::kMaxRecordSize;
      lastCut_ = true;
    }
  }
  bytes = source_.bytes.subspan(e.offset, size);
  attributes = e.attributes;
  uniqueID = e.uniqueID;
  return true;
}

namespace {

// Start and end (exclusive) of record `index`, from the file's own entries.
bool LocateRecord(const std::string& path, size_t index, uint64_t& start, uint64_t& end) {
  Header h;
  if (ReadHeader(path, h) == 0 || index >= h.numRecords) return false;
  uint8_t entries[2 * format::kEntrySize];
  bool last = index + 1 >= h.numRecords;
  size_t want = last ? format::kEntrySize : 2 * format::kEntrySize;
  if (ReadFileRange(path, format::kListOffset + index * format::kEntrySize, want, entries) !=
      static_cast<int64_t>(want)) {
    return false;
  }
  start = DecodeEntry(entries).offset;
  if (last) {
    int64_t size = FileSize(path);
    if (size < 0) return false;
    end = static_cast<uint64_t>(size);
  } else {
    end = DecodeEntry(entries + format::kEntrySize).offset;
  }
  return end >= start;
}

}  // namespace

bool ReadRecordAt(const std::string& path, size_t index, std::vector<uint8_t>& out) {
  uint64_t start = 0, end = 0;
  if (!LocateRecord(path, index, start, end)) return false;
  if (end - start >= format::kMaxRecordSize) return false;
  out.resize(end - start);
  if (out.empty()) return true;
  return ReadFileRange(path, start, out.size(), out.data()) == static_cast<int64_t>(out.size());
}

int CopyRecordToFile(const std::string& databasePath, size_t index, const std::string& outPath) {
  uint64_t start = 0, end = 0;
  if (!LocateRecord(databasePath, index, start, end)) return 0;
  uint64_t size = end > start ? end - start - 1 : 0;
  if (size >= format::kMaxRecordSize) return 0;
  std::vector<uint8_t> bytes(size);
  if (size && ReadFileRange(databasePath, start, size, bytes.data()) != static_cast<int64_t>(size)) {
    return 0;
  }
  return WriteFileSafely(outPath, bytes.data(), bytes.size()).ok() ? 1 : 0;
}

}  // namespace cx
