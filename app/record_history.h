// Undo and redo of record changes. Records are immutable byte blocks, so a
// step keeps the bytes before and after the change and where the record
// stood; undoing puts the other bytes back with the same follow-up work as
// the change had (sorted place, calculated fields, view). Records are found
// again by their bytes, so sorts and other moves between the change and
// its undo do no harm; a step whose record cannot be found any more is
// dropped rather than applied to the wrong record.
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <algorithm>
#include <map>
#include <vector>

#include "engine/record.h"
#include "ops/session.h"

namespace cx {

struct RecordStep {
  enum class Kind { Change, Add, Delete };
  Kind kind = Kind::Change;
  Bytes before;  // empty for Add
  Bytes after;   // empty for Delete
  size_t beforeIndex = 0;
  size_t afterIndex = 0;
  uint8_t attributes = 0;  // of a deleted record, restored with it
  uint32_t uniqueID = 0;
  // An in-place edit leaves the record where it stands; so does its undo.
  bool inPlace = false;
};

class RecordHistory {
 public:
  static constexpr size_t kMaxSteps = 200;

  void Push(RecordStep step);
  bool CanUndo() const { return !undo_.empty(); }
  bool CanRedo() const { return !redo_.empty(); }
  // Each returns the record index to make current, or -1 when nothing was
  // done (no step, or its record could not be found: the step is dropped).
  long Undo(DataSession& session);
  long Redo(DataSession& session);
  void Clear();

 private:
  std::deque<RecordStep> undo_;
  std::deque<RecordStep> redo_;
};

// One history per open database, kept by whoever holds the open databases.
class RecordHistories {
 public:
  RecordHistory& For(const Database* db) { return byDatabase_[db]; }
  void Forget(const Database* db) { byDatabase_.erase(db); }
  // Drops the histories of every database not in `open`: a database let go
  // may be followed by another at the same address.
  void KeepOnly(const std::vector<const Database*>& open) {
    std::erase_if(byDatabase_, [&](const auto& entry) {
      return std::find(open.begin(), open.end(), entry.first) == open.end();
    });
  }

 private:
  std::map<const Database*, RecordHistory> byDatabase_;
};

// The index of the record whose bytes are `bytes` (calculated results may
// differ), looking at `hint` first; -1 when there is none.
long FindRecord(const Database& db, ByteView bytes, size_t hint);

}  // namespace cx
