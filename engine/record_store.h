// The open database as one object: its path, header copy, schema, popup
// lists and data records, held in memory between opening and saving.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "engine/container.h"
#include "engine/popups.h"
#include "engine/record.h"
#include "engine/record_reader.h"
#include "engine/schema.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "platform/large_block.h"
#include "platform/status.h"
#include "platform/ui_port.h"

namespace cx {

// One data record: its stored bytes (a view into the file image it was
// read from, or a block of its own once replaced), attributes and unique id.
class DataRecord {
 public:
  DataRecord() = default;
  DataRecord(ByteView bytes, uint8_t attributes, uint32_t uniqueID)
      : data_(bytes.data()), size_(static_cast<uint32_t>(bytes.size())),
        attributes_(attributes), uniqueID_(uniqueID) {}
  DataRecord(Bytes bytes, uint8_t attributes, uint32_t uniqueID);

  ByteView bytes() const { return ByteView(data_, size_); }
  uint32_t size() const { return size_; }
  uint8_t attributes() const { return attributes_; }
  uint32_t uniqueID() const { return uniqueID_; }
  void SetBytes(Bytes bytes);
  // The same from bytes the caller keeps (copied into one block).
  void SetBytes(ByteView bytes);
  // Bytes that `owner` keeps alive (a block shared with other records).
  void SetBytes(std::shared_ptr<const uint8_t[]> owner, ByteView bytes);

 private:
  const uint8_t* data_ = nullptr;
  uint32_t size_ = 0;
  uint8_t attributes_ = 0;
  uint32_t uniqueID_ = 0;
  // One allocation per replaced record: a recalculation after a sort
  // replaces nearly every record of the file.
  std::shared_ptr<const uint8_t[]> owned_;
};

// Room for many records replaced in one go (a recalculation of the whole
// file): the copies share blocks, so that neither making them nor freeing
// them costs an allocation each. A block lives as long as one record still
// uses it; blocks start small and grow, so that a pass that replaces only a
// record or two keeps little more than those alive.
class RecordArena {
 public:
  // A copy of `bytes` and the block that holds it.
  std::pair<std::shared_ptr<const uint8_t[]>, ByteView> Copy(ByteView bytes);

 private:
  static constexpr size_t kFirstBlock = size_t{8} << 10;
  // Blocks this large come in large pages (AllocateLargeBlock).
  static constexpr size_t kLargestBlock = size_t{4} << 20;
  std::shared_ptr<uint8_t[]> block_;
  size_t size_ = 0;
  size_t used_ = 0;
};

// How many records of a database, from the first, a pass that changes
// them has finished with: a save running beside the pass (SaveAlong)
// writes those while the pass goes on. Advance and Finish come from the
// pass's thread, WaitBeyond from the saving one.
class RecordsReady {
 public:
  static constexpr size_t kAll = SIZE_MAX;
  // The records below `count` will not change again.
  void Advance(size_t count) {
    ready_.store(count, std::memory_order_release);
    ready_.notify_one();
  }
  // No record will change again, nor anything else the file holds.
  void Finish() { Advance(kAll); }
  // Blocks until more than `count` records are final; how many are
  // (kAll once Finish was called).
  size_t WaitBeyond(size_t count) const {
    size_t now = ready_.load(std::memory_order_acquire);
    while (now <= count) {
      ready_.wait(now, std::memory_order_acquire);
      now = ready_.load(std::memory_order_acquire);
    }
    return now;
  }

 private:
  std::atomic<size_t> ready_{0};
};

// Every data record of a file, in file order.
using RecordTable = std::vector<DataRecord, LargePageAllocator<DataRecord>>;

// How many of `records` are not well formed (RecordIsWellFormed), counted
// as an open of a large file needs it: quickly.
size_t CountMalformed(const RecordTable& records);

// What a database file holds before its data records. Commands that show
// only the header, the schema or the popup lists need no more than this,
// and reading it costs the same whatever the number of records.
struct DatabaseHead {
  Header header;
  Schema schema = InitSchema();
  PopupLists popups{};
  uint8_t schemaAttributes = 0;
  uint32_t schemaUniqueID = 0;
  // How many data records the file's entry list announces (none are read).
  size_t dataRecords = 0;
};

// Reads the head of a database file by the same rules as Database::Open,
// but only the bytes before record 31. Nothing is shown: on failure the
// status holds the message the open would show.
Status ReadDatabaseHead(const std::string& path, DatabaseHead& head);

class Database {
 public:
  Database();

  // A new, empty database (not yet on disk) at `path`, named `name`.
  static Database CreateNew(const std::string& path, const std::string& name);

  // Opens a database file. On failure the message has been shown through
  // `ui` (and is in the status) and this object is unchanged. A data record
  // that cannot be read is reported and ends the reading, yet the open
  // succeeds with the records before it; partial() then tells, and Save()
  // will not overwrite the original file.
  Status Open(const std::string& path, UiPort& ui, FileBuffer::Access access = FileBuffer::Access::kCopy);
  // Says from a file's schema whether it may be opened at all (its
  // protection), having told the user why not when it says no.
  using Admission = std::function<bool(const Schema&)>;
  // Open() that asks `admit` once the schema is read, before any record is:
  // one reading of the file serves both.
  Status Open(const std::string& path, UiPort& ui, FileBuffer::Access access, const Admission& admit);
  // The same open of a file's bytes already in memory (a database that
  // arrived from outside and is not stored yet), named `path`.
  Status OpenBytes(const std::string& path, std::shared_ptr<const Bytes> bytes, UiPort& ui);

  // Writes the database to its path (or to `path`), never damaging the file
  // being replaced. On success the changed mark is cleared; on failure it
  // stays, and the message is in the status. The file this database was
  // read from (or last saved to) is not replaced when it has changed on
  // disk since then: another program's changes would be lost without a
  // word. See ChangedOnDisk and AcceptDiskState.
  Status Save(const Clock& clock = DefaultClock());
  Status SaveAs(const std::string& path, const Clock& clock = DefaultClock());
  // Save() on a thread of its own while another thread finishes the
  // records (a recalculation), so that writing them overlaps that work.
  // Until its first Advance of `ready` the other thread may still do
  // anything with the database; from then until Finish it may change only
  // the bytes of records at or after the mark, and add, remove or move
  // none.
  Status SaveAlong(const RecordsReady& ready, const Clock& clock = DefaultClock());

  // True when the file at path() is no longer the one this database was
  // read from or last saved to (another program replaced or rewrote it).
  bool ChangedOnDisk() const;
  // Takes the file as it is now on disk as the one this database came
  // from, so that the next save replaces it: for a caller whose user
  // chose to keep this version over the other program's.
  void AcceptDiskState();

  const std::string& path() const { return path_; }
  void SetPath(const std::string& path) { path_ = path; }
  const Header& header() const { return header_; }
  Header& header() { return header_; }
  const Schema& schema() const { return schema_; }
  Schema& schema() { return schema_; }
  const PopupLists& popups() const { return popups_; }
  PopupLists& popups() { return popups_; }
  uint8_t schemaAttributes() const { return schemaAttributes_; }
  uint32_t schemaUniqueID() const { return schemaUniqueID_; }

  size_t recordCount() const { return records_.size(); }
  ByteView record(size_t index) const { return records_[index].bytes(); }
  const DataRecord& entry(size_t index) const { return records_[index]; }
  // The record table, for operations that reorder it (sorting).
  RecordTable& table() { return records_; }
  const RecordTable& table() const { return records_; }

  // Adding is refused (false) when the database already holds 65504
  // records. New records get attributes 0 and unique id 0 unless given.
  bool CanAddRecord() const { return records_.size() < format::kMaxDataRecords; }
  bool InsertRecord(size_t position, Bytes stored, uint8_t attributes = 0, uint32_t uniqueID = 0);
  bool AppendRecord(Bytes stored, uint8_t attributes = 0, uint32_t uniqueID = 0);
  void ReplaceRecord(size_t index, Bytes stored);
  void ReplaceRecord(size_t index, ByteView stored);
  // The same with the copy made in `arena`.
  void ReplaceRecord(size_t index, ByteView stored, RecordArena& arena);
  void DeleteRecord(size_t index);
  void MoveRecord(size_t from, size_t to);

  // The next number for a Unique or Link field: one more than the largest
  // such value in the database (1 when there is none), then counting up.
  uint32_t NextUniqueNumber();
  uint32_t TakeUniqueNumber() { return nextUnique_ = NextUniqueNumber(), nextUnique_++; }
  void SetNextUniqueNumber(uint32_t next) { nextUnique_ = next; }

  bool changed() const { return changed_; }
  void MarkChanged() { changed_ = true; }
  void ClearChanged() { changed_ = false; }
  bool partial() const { return partial_; }
  // Records whose slot lengths run past their end (reported at open).
  size_t malformedRecords() const { return malformed_; }

  std::string Name() const { return header_.Name(); }

 private:
  Status Load(const std::string& path, RecordSource source, UiPort& ui, const Admission& admit = {});
  Status Write(const std::string& target, const Clock& clock, const RecordsReady* ready);
  // The header and entry list for the records as they are now; false when
  // the file would be too large.
  bool EncodeHead(const Clock& clock, size_t schemaSize, const std::array<Bytes, format::kPopupRecords>& popups,
                  Header& header, Bytes& head) const;
  // Records [from, to), those that lie side by side in one write each.
  void WriteRecords(SafeFileWriter& out, size_t from, size_t to) const;

  std::string path_;
  Header header_;
  Schema schema_;
  PopupLists popups_{};
  uint8_t schemaAttributes_ = 0;
  uint32_t schemaUniqueID_ = 0;
  RecordTable records_;
  std::shared_ptr<const void> image_;  // keeps the views of unchanged records alive
  // The file as read or last written; nothing for a database not yet on disk.
  std::optional<FileState> diskState_;
  uint32_t nextUnique_ = 0;  // 0: not yet computed
  bool changed_ = false;
  bool partial_ = false;
  size_t malformed_ = 0;
};

// Messages of opening, as shown to the user.
namespace messages {
inline constexpr const char* kCannotOpen = "ERROR: Cannot Open File: %s for reading";
inline constexpr const char* kBadHeader =
    "ERROR: Reading header!\nMake sure you are converting a Cardovex data file!\n";
inline constexpr const char* kCannotInit = "Could not initialize file";
inline constexpr const char* kCannotReadSchema = "Could not read file";
inline constexpr const char* kCannotReadRecord = "ERROR:Reading Record: %d";
inline constexpr const char* kChangedOnDisk =
    "%s was changed by another program after it was opened here, so it was not replaced. "
    "Open it again to see those changes.";
}  // namespace messages

// printf-style "%s"/"%d" substitution for the messages above.
std::string FormatMessage(const char* pattern, const std::string& text);
std::string FormatMessage(const char* pattern, long number);

}  // namespace cx
