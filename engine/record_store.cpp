#include "engine/record_store.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <thread>

#include "engine/byte_order.h"
#include "platform/file_io.h"
#include "platform/large_block.h"
#include "platform/run_beside.h"

namespace cx {

DataRecord::DataRecord(Bytes bytes, uint8_t attributes, uint32_t uniqueID)
    : attributes_(attributes), uniqueID_(uniqueID) {
  SetBytes(ByteView(bytes));
}

void DataRecord::SetBytes(Bytes bytes) { SetBytes(ByteView(bytes)); }

void DataRecord::SetBytes(ByteView bytes) {
  std::shared_ptr<uint8_t[]> block = std::make_shared_for_overwrite<uint8_t[]>(bytes.size());
  if (!bytes.empty()) std::memcpy(block.get(), bytes.data(), bytes.size());
  data_ = block.get();
  size_ = static_cast<uint32_t>(bytes.size());
  owned_ = std::move(block);
}

void DataRecord::SetBytes(std::shared_ptr<const uint8_t[]> owner, ByteView bytes) {
  data_ = bytes.data();
  size_ = static_cast<uint32_t>(bytes.size());
  owned_ = std::move(owner);
}

std::pair<std::shared_ptr<const uint8_t[]>, ByteView> RecordArena::Copy(ByteView bytes) {
  if (!block_ || used_ + bytes.size() > size_) {
    size_ = block_ ? std::min(size_ * 2, kLargestBlock) : kFirstBlock;
    size_ = std::max(size_, bytes.size());
    block_ = size_ >= kLargePage ? AllocateLargeBlock(size_) : std::make_shared_for_overwrite<uint8_t[]>(size_);
    used_ = 0;
  }
  uint8_t* at = block_.get() + used_;
  if (!bytes.empty()) std::memcpy(at, bytes.data(), bytes.size());
  used_ += bytes.size();
  return {block_, ByteView(at, bytes.size())};
}

namespace {

// The largest number a record holds in a Unique or Link slot (0 if none).
uint32_t LargestUniqueValue(const Schema& schema, ByteView record) {
  uint32_t largest = 0;
  for (int slot = 0; slot < format::kFieldCount; ++slot) {
    FieldType t = schema.field[slot].type();
    if (t != FieldType::Unique && t != FieldType::Link) continue;
    if (auto v = FieldValue(record, slot)) largest = std::max(largest, ValueNumber(*v));
  }
  return largest;
}

// Once the next unique number has been worked out (`next` nonzero), a
// record that arrives with a larger one (received, imported, converted)
// must move it on, or a later record would get a number already in use.
void KeepAbove(uint32_t& next, const Schema& schema, ByteView record) {
  if (next == 0) return;
  uint32_t largest = LargestUniqueValue(schema, record);
  if (largest >= next && largest != UINT32_MAX) next = largest + 1;
}

// True when both names lead to the same file, however they are spelt.
bool SameFile(const std::string& a, const std::string& b) {
  if (a == b) return true;
  std::error_code ec;
  if (std::filesystem::equivalent(a, b, ec) && !ec) return true;
  const auto ca = std::filesystem::weakly_canonical(a, ec);
  if (ec) return false;
  const auto cb = std::filesystem::weakly_canonical(b, ec);
  return !ec && ca == cb;
}

// The part of reading shared by the full open and the head alone: the
// creator check, the entry list, the schema and the popup lists. `reader`
// is left before the first data record.
Status ReadHead(RecordReader& reader, RecordSource source, DatabaseHead& head) {
  if (source.bytes.size() < format::kHeaderSize) return Status::Error(messages::kBadHeader);
  head.header = DecodeHeader(source.bytes.data());
  if (head.header.creator != format::kCreator) return Status::Error(messages::kBadHeader);
  if (!reader.Open(std::move(source), head.header.numRecords)) {
    return Status::Error(messages::kCannotInit);
  }
  ByteView bytes;
  uint8_t attributes = 0;
  uint32_t uniqueID = 0;
  if (!reader.Next(bytes, attributes, uniqueID) || !ReadSchema(bytes, head.schema)) {
    return Status::Error(messages::kCannotReadSchema);
  }
  head.schemaAttributes = attributes;
  head.schemaUniqueID = uniqueID;
  for (int i = 0; i < format::kPopupRecords; ++i) {
    if (reader.index() >= reader.count()) break;
    if (reader.Next(bytes, attributes, uniqueID)) {
      head.popups[i] = DecodePopupList(bytes, attributes, uniqueID);
    } else {
      // An unreadable list stays empty, but its entry is kept.
      const RecordEntry& e = reader.entries()[reader.index() - 1];
      head.popups[i].attributes = e.attributes;
      head.popups[i].uniqueID = e.uniqueID;
    }
  }
  const size_t count = head.header.numRecords;
  head.dataRecords = count > format::kFirstDataRecord ? count - format::kFirstDataRecord : 0;
  return Status::Ok();
}

}  // namespace

Status ReadDatabaseHead(const std::string& path, DatabaseHead& head) {
  const std::string cannotOpen = FormatMessage(messages::kCannotOpen, path);
  Header header;
  const int found = ReadHeader(path, header);
  if (found == 0) return Status::Error(cannotOpen);
  if (found < 0) return Status::Error(messages::kBadHeader);
  const int64_t fileSize = FileSize(path);
  if (fileSize < 0) return Status::Error(cannotOpen);
  const uint64_t size = static_cast<uint64_t>(fileSize);
  const size_t count = header.numRecords;
  const uint64_t listEnd = format::kListOffset + uint64_t{count} * format::kEntrySize;

  // Where the head ends: at record 31, or a record's largest size past the
  // start of the last one when the file holds no data records.
  uint64_t end = listEnd;
  if (count > 0) {
    const size_t last = std::min<size_t>(count, format::kFirstDataRecord + 1) - 1;
    uint8_t entry[format::kEntrySize];
    if (listEnd <= size &&
        ReadFileRange(path, format::kListOffset + last * format::kEntrySize, sizeof entry, entry) ==
            static_cast<int64_t>(sizeof entry)) {
      const uint64_t at = DecodeEntry(entry).offset;
      end = std::max(end, last == format::kFirstDataRecord ? at : at + format::kMaxRecordSize + 1);
    }
  }
  end = std::min(end, size);
  auto bytes = std::make_shared<Bytes>(static_cast<size_t>(end));
  const int64_t got = bytes->empty() ? 0 : ReadFileRange(path, 0, bytes->size(), bytes->data());
  if (got < 0) return Status::Error(cannotOpen);
  bytes->resize(static_cast<size_t>(got));

  RecordReader reader;
  RecordSource source{bytes, ByteView(*bytes)};
  DatabaseHead read;
  Status status = ReadHead(reader, std::move(source), read);
  if (status) head = std::move(read);
  return status;
}

std::string FormatMessage(const char* pattern, const std::string& text) {
  std::string out = pattern;
  size_t at = out.find("%s");
  if (at != std::string::npos) out.replace(at, 2, text);
  return out;
}

std::string FormatMessage(const char* pattern, long number) {
  std::string out = pattern;
  size_t at = out.find("%d");
  if (at != std::string::npos) out.replace(at, 2, std::to_string(number));
  return out;
}

Database::Database() : schema_(InitSchema()) {}

namespace {

// CountMalformed over records [first, last).
size_t CountMalformedIn(const RecordTable& records, size_t first, size_t last) {
  // Each slot's length tells where the next one lies, so one record's walk
  // is a chain of loads that wait for each other. Four records walked side
  // by side let those waits overlap.
  constexpr size_t kLanes = 4;
  struct Walk {
    const uint8_t* data;
    size_t size;
    size_t off;
    int slot;
  };
  size_t malformed = 0;
  // Each lane takes its own quarter of the records, so that the lanes read
  // four places of the file image at once rather than one.
  const size_t quarter = (last - first) / kLanes;
  size_t n = first;
  for (; n < first + quarter; ++n) {
    Walk walk[kLanes];
    unsigned active = 0;
    for (size_t lane = 0; lane < kLanes; ++lane) {
      const ByteView r = records[n + lane * quarter].bytes();
      if (r.empty()) continue;
      const size_t off = DataStart(r);
      if (off > r.size()) {
        ++malformed;
        continue;
      }
      walk[lane] = {r.data(), r.size(), off, 0};
      active |= 1u << lane;
    }
    while (active) {
      for (size_t lane = 0; lane < kLanes; ++lane) {
        const unsigned bit = 1u << lane;
        if (!(active & bit)) continue;
        Walk& w = walk[lane];
        if (w.slot == format::kFieldCount || w.off + 2 > w.size) {
          active &= ~bit;
          continue;
        }
        const uint16_t len = GetLE16(w.data + w.off);
        if (len == format::kEndMark) {
          active &= ~bit;
        } else if (w.off + 2 + len > w.size) {
          ++malformed;
          active &= ~bit;
        } else {
          w.off += 2 + size_t{len};
          ++w.slot;
        }
      }
    }
  }
  for (n = first + kLanes * quarter; n < last; ++n) {
    if (!RecordIsWellFormed(records[n].bytes())) ++malformed;
  }
  return malformed;
}

// Files with this many records have their second half checked on a
// second thread: the walk reads the whole file image, which for a large
// file waits mostly for memory.
constexpr size_t kRecordsCheckedInTwo = 16384;

}  // namespace

size_t CountMalformed(const RecordTable& records) {
  const size_t count = records.size();
  if (count < kRecordsCheckedInTwo || std::thread::hardware_concurrency() < 2) {
    return CountMalformedIn(records, 0, count);
  }
  size_t first = 0, second = 0;
  RunBeside([&] { second = CountMalformedIn(records, count / 2, count); },
            [&] { first = CountMalformedIn(records, 0, count / 2); });
  return first + second;
}

Database Database::CreateNew(const std::string& path, const std::string& name) {
  Database db;
  db.path_ = path;
  db.header_ = InitHeader(name);
  db.schema_ = InitSchema();
  return db;
}

Status Database::Open(const std::string& path, UiPort& ui, FileBuffer::Access access) {
  return Open(path, ui, access, {});
}

Status Database::Open(const std::string& path, UiPort& ui, FileBuffer::Access access, const Admission& admit) {
  auto image = std::make_shared<FileBuffer>();
  if (!image->Read(path, access)) {
    const std::string message = FormatMessage(messages::kCannotOpen, path);
    ui.SetBusy(false);
    ui.ShowMessage(message, "Error", MessageIcon::Error);
    return Status::Error(message);
  }
  const ByteView bytes(image->data(), image->size());
  const auto state = image->state();
  Status status = Load(path, RecordSource{std::move(image), bytes}, ui, admit);
  // Remembered so that a save can tell whether someone else changed the file.
  if (status) diskState_ = state;
  return status;
}

Status Database::OpenBytes(const std::string& path, std::shared_ptr<const Bytes> bytes, UiPort& ui) {
  const ByteView view = bytes ? ByteView(*bytes) : ByteView();
  return Load(path, RecordSource{std::move(bytes), view}, ui);
}

Status Database::Load(const std::string& path, RecordSource source, UiPort& ui, const Admission& admit) {
  auto fail = [&ui](std::string message) {
    ui.SetBusy(false);
    ui.ShowMessage(message, "Error", MessageIcon::Error);
    return Status::Error(std::move(message));
  };

  RecordReader reader;
  DatabaseHead head;
  std::shared_ptr<const void> image = source.owner;
  if (Status status = ReadHead(reader, std::move(source), head); !status) {
    return fail(status.message());
  }
  if (admit && !admit(head.schema)) return Status::Error("The database was not opened: access was refused");
  Database db;
  db.path_ = path;
  db.header_ = head.header;
  db.schema_ = std::move(head.schema);
  db.popups_ = std::move(head.popups);
  db.schemaAttributes_ = head.schemaAttributes;
  db.schemaUniqueID_ = head.schemaUniqueID;

  ByteView bytes;
  uint8_t attributes = 0;
  uint32_t uniqueID = 0;
  const size_t dataCount = head.dataRecords;
  db.records_.reserve(dataCount);
  for (size_t n = 0; n < dataCount; ++n) {
    if (!reader.Next(bytes, attributes, uniqueID)) {
      ui.SetBusy(false);
      ui.ShowMessage(FormatMessage(messages::kCannotReadRecord, static_cast<long>(n)), "Error",
                     MessageIcon::Error);
      db.partial_ = true;
      break;
    }
    db.records_.emplace_back(bytes, attributes, uniqueID);
  }
  db.malformed_ = CountMalformed(db.records_);
  if (reader.lastRecordCut()) {
    // Saving would write the cut record back and lose the rest of it.
    db.partial_ = true;
    ui.ShowMessage("The last record of this file is longer than 65535 bytes and was read only "
                   "in part; save the database under another name to keep the original file.",
                   "Error", MessageIcon::Warning);
  }
  if (db.malformed_) {
    ui.ShowMessage(std::to_string(db.malformed_) +
                       " record(s) hold values that run past the end of the record; those "
                       "values are shown cut short and are kept as they are unless edited.",
                   "Error", MessageIcon::Warning);
  }
  db.image_ = std::move(image);
  *this = std::move(db);
  return Status::Ok();
}

Status Database::Save(const Clock& clock) { return SaveAs(path_, clock); }

Status Database::SaveAs(const std::string& target, const Clock& clock) { return Write(target, clock, nullptr); }

Status Database::SaveAlong(const RecordsReady& ready, const Clock& clock) { return Write(path_, clock, &ready); }

bool Database::EncodeHead(const Clock& clock, size_t schemaSize,
                          const std::array<Bytes, format::kPopupRecords>& popups, Header& header,
                          Bytes& head) const {
  const size_t numRecords = format::kFirstDataRecord + records_.size();
  header = header_;
  header.numRecords = static_cast<uint16_t>(numRecords);
  header.appInfoID = static_cast<uint32_t>(80 + format::kEntrySize * numRecords);
  int64_t now = clock.Now() + (clock.DaylightSaving() ? 3600 : 0);
  header.modificationDate = static_cast<uint32_t>(now);

  // Entry list, built in one block.
  head.assign(format::kHeaderSize + format::kEntrySize * numRecords + format::kGapSize + format::kAppInfoSize,
              0);
  EncodeHeader(header, head.data());
  uint64_t offset = header.appInfoID + format::kAppInfoSize;
  uint8_t* entry = head.data() + format::kHeaderSize;
  auto putEntry = [&](uint8_t attributes, uint32_t uniqueID, size_t size) {
    EncodeEntry({static_cast<uint32_t>(offset), attributes, uniqueID}, entry);
    entry += format::kEntrySize;
    offset += size;
  };
  uint8_t schemaAttr = static_cast<uint8_t>(schemaAttributes_ & ~format::kDirtyBit);
  if (changed_) schemaAttr |= format::kDirtyBit;
  putEntry(schemaAttr, schemaUniqueID_, schemaSize);
  for (int i = 0; i < format::kPopupRecords; ++i) {
    putEntry(popups_[i].attributes, popups_[i].uniqueID, popups[i].size());
  }
  for (const DataRecord& r : records_) putEntry(r.attributes(), r.uniqueID(), r.size());
  return offset <= UINT32_MAX;
}

void Database::WriteRecords(SafeFileWriter& out, size_t from, size_t to) const {
  // Records that still lie side by side in the file they were read from go
  // out in one write each run (after an unchanged open: the whole data part).
  for (size_t i = from; i < to;) {
    const uint8_t* start = records_[i].bytes().data();
    size_t run = records_[i].size();
    size_t j = i + 1;
    while (j < to && records_[j].bytes().data() == start + run) run += records_[j++].size();
    out.Write(start, run);
    i = j;
  }
}

Status Database::Write(const std::string& target, const Clock& clock, const RecordsReady* ready) {
  SafeFileWriter out(target);
  // Along with a pass, nothing of the database is looked at before the
  // pass has finished its first records; the new file can be made meanwhile.
  if (ready) {
    if (Status s = out.Open(); !s) return s;
    ready->WaitBeyond(0);
  }
  if (partial_ && SameFile(target, path_)) {
    return Status::Error(
        "ERROR: This database could only be read in part.\nSave it under another name so that "
        "the original file is kept.");
  }
  if (diskState_ && SameFile(target, path_)) {
    std::optional<FileState> now = StatFile(target);
    if (now && *now != *diskState_) return Status::Error(FormatMessage(messages::kChangedOnDisk, target));
  }
  const size_t numRecords = format::kFirstDataRecord + records_.size();
  if (numRecords > format::kMaxFileRecords) return Status::Error("ERROR: Too many records to save");
  const Status tooLarge = Status::Error("ERROR: The database is too large to save");

  const Bytes schemaBytes = WriteSchema(schema_);
  std::array<Bytes, format::kPopupRecords> popupBytes;
  for (int i = 0; i < format::kPopupRecords; ++i) popupBytes[i] = popups_[i].Encode();
  Header header;
  Bytes head;
  if (!ready) {
    if (!EncodeHead(clock, schemaBytes.size(), popupBytes, header, head)) return tooLarge;
    if (Status s = out.Open(); !s) return s;
    out.Write(head.data(), head.size());
    out.Write(schemaBytes.data(), schemaBytes.size());
    for (const Bytes& p : popupBytes) out.Write(p.data(), p.size());
    WriteRecords(out, 0, records_.size());
  } else {
    // The records go first, each run as soon as the pass is done with it;
    // what comes before them is known only once every record is final.
    Bytes front(format::kHeaderSize + format::kEntrySize * numRecords + format::kGapSize +
                format::kAppInfoSize);
    front.insert(front.end(), schemaBytes.begin(), schemaBytes.end());
    for (const Bytes& p : popupBytes) front.insert(front.end(), p.begin(), p.end());
    out.SkipTo(front.size());
    const size_t count = records_.size();
    size_t done = 0;
    for (size_t now = ready->WaitBeyond(0); done < count || now != RecordsReady::kAll;
         now = ready->WaitBeyond(now)) {
      const size_t upTo = std::min(now, count);
      WriteRecords(out, done, upTo);
      done = std::max(done, upTo);
      if (now == RecordsReady::kAll) break;
    }
    if (!EncodeHead(clock, schemaBytes.size(), popupBytes, header, head)) return tooLarge;
    std::copy(head.begin(), head.end(), front.begin());
    out.WriteAt(0, front.data(), front.size());
  }
  if (Status s = out.Commit(); !s) return s;

  header_ = header;
  path_ = target;
  diskState_ = out.written();
  partial_ = false;
  changed_ = false;
  return Status::Ok();
}

bool Database::ChangedOnDisk() const {
  if (!diskState_) return false;
  std::optional<FileState> now = StatFile(path_);
  return now && *now != *diskState_;
}

void Database::AcceptDiskState() {
  if (std::optional<FileState> now = StatFile(path_)) diskState_ = now;
}

bool Database::InsertRecord(size_t position, Bytes stored, uint8_t attributes, uint32_t uniqueID) {
  if (!CanAddRecord()) return false;
  KeepAbove(nextUnique_, schema_, stored);
  position = std::min(position, records_.size());
  records_.insert(records_.begin() + static_cast<std::ptrdiff_t>(position),
                  DataRecord(std::move(stored), attributes, uniqueID));
  changed_ = true;
  return true;
}

bool Database::AppendRecord(Bytes stored, uint8_t attributes, uint32_t uniqueID) {
  return InsertRecord(records_.size(), std::move(stored), attributes, uniqueID);
}

void Database::ReplaceRecord(size_t index, Bytes stored) { ReplaceRecord(index, ByteView(stored)); }

void Database::ReplaceRecord(size_t index, ByteView stored) {
  KeepAbove(nextUnique_, schema_, stored);
  records_[index].SetBytes(stored);
  changed_ = true;
}

void Database::ReplaceRecord(size_t index, ByteView stored, RecordArena& arena) {
  KeepAbove(nextUnique_, schema_, stored);
  auto [owner, copy] = arena.Copy(stored);
  records_[index].SetBytes(std::move(owner), copy);
  changed_ = true;
}

void Database::DeleteRecord(size_t index) {
  records_.erase(records_.begin() + static_cast<std::ptrdiff_t>(index));
  changed_ = true;
}

void Database::MoveRecord(size_t from, size_t to) {
  if (from == to || from >= records_.size() || to >= records_.size()) return;
  if (from < to) {
    std::rotate(records_.begin() + from, records_.begin() + from + 1, records_.begin() + to + 1);
  } else {
    std::rotate(records_.begin() + to, records_.begin() + from, records_.begin() + from + 1);
  }
  changed_ = true;
}

uint32_t Database::NextUniqueNumber() {
  if (nextUnique_ != 0) return nextUnique_;
  uint32_t largest = 0;
  for (const DataRecord& r : records_) largest = std::max(largest, LargestUniqueValue(schema_, r.bytes()));
  nextUnique_ = largest + 1;
  return nextUnique_;
}

}  // namespace cx
