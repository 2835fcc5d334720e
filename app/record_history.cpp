#include "app/record_history.h"

#include <algorithm>

#include "ops/calc.h"
#include "ops/field_values.h"
#include "ops/sort.h"
#include "ops/view.h"

namespace cx {
namespace {

bool SameBytes(ByteView a, ByteView b) { return std::equal(a.begin(), a.end(), b.begin(), b.end()); }

// Equal but for Calculated results, which a later pass may have changed.
bool SameButResults(const Schema& schema, ByteView a, ByteView b) {
  const SlotValues va = AllSlotValues(a);
  const SlotValues vb = AllSlotValues(b);
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (IsCalculated(schema, f)) continue;
    if (va[f].has_value() != vb[f].has_value()) return false;
    if (va[f] && !SameBytes(*va[f], *vb[f])) return false;
  }
  return true;
}

void MarkDifferences(DataSession& session, ByteView a, ByteView b) {
  const SlotValues va = AllSlotValues(a);
  const SlotValues vb = AllSlotValues(b);
  for (int f = 0; f < format::kFieldCount; ++f) {
    const bool same = va[f].has_value() == vb[f].has_value() && (!va[f] || SameBytes(*va[f], *vb[f]));
    if (!same) session.calc.fieldChanged[f] = 1;
  }
}

void Finish(DataSession& session) {
  session.calc.fieldChanged.fill(0);
  session.view = RebuildView(session.db, session.Link());
  session.db.MarkChanged();
}

// Puts `to` in place of the record holding `from` (or adds / removes it)
// and updates the step's positions. The index to make current (-1 when
// the table is empty), or -2 when the record is gone or cannot be added.
long Apply(DataSession& session, RecordStep& step, bool forward) {
  Database& db = session.db;
  const Bytes& from = forward ? step.before : step.after;
  const Bytes& to = forward ? step.after : step.before;
  size_t& fromIndex = forward ? step.beforeIndex : step.afterIndex;
  size_t& toIndex = forward ? step.afterIndex : step.beforeIndex;
  const bool removing = to.empty();
  const bool adding = from.empty();

  if (adding) {
    if (!db.CanAddRecord()) return -2;
    const size_t at = std::min(toIndex, db.recordCount());
    db.InsertRecord(at, to, step.attributes, step.uniqueID);
    MarkDifferences(session, ByteView(), to);
    if (HasCalculatedField(db.schema())) RecalculateRecord(session, at);
    const size_t placed = RepositionRecord(db, at);
    // Placed among records that were computed without it.
    RecalculateAfterMove(session, db.recordCount(), placed);
    toIndex = placed;
    Finish(session);
    return static_cast<long>(placed);
  }

  const long found = FindRecord(db, from, fromIndex);
  if (found < 0) return -2;
  const size_t index = static_cast<size_t>(found);
  if (removing) {
    step.attributes = db.entry(index).attributes();
    step.uniqueID = db.entry(index).uniqueID();
    db.DeleteRecord(index);
    RecalculateAfterMove(session, index, index + 1);
    toIndex = index;
    fromIndex = index;
    Finish(session);
    return db.recordCount() == 0 ? -1 : static_cast<long>(std::min(index, db.recordCount() - 1));
  }
  MarkDifferences(session, db.record(index), to);
  db.ReplaceRecord(index, to);
  if (HasCalculatedField(db.schema())) RecalculateRecord(session, index);
  const size_t placed = step.inPlace ? index : RepositionRecord(db, index);
  Bytes expected(db.record(placed).begin(), db.record(placed).end());
  RecalculateAfterMove(session, index, placed);
  Finish(session);
  const long now = FindRecord(db, expected, placed);
  toIndex = now >= 0 ? static_cast<size_t>(now) : placed;
  fromIndex = index;
  return static_cast<long>(toIndex);
}

}  // namespace

long FindRecord(const Database& db, ByteView bytes, size_t hint) {
  const size_t count = db.recordCount();
  if (hint < count && SameBytes(db.record(hint), bytes)) return static_cast<long>(hint);
  for (size_t i = 0; i < count; ++i) {
    if (SameBytes(db.record(i), bytes)) return static_cast<long>(i);
  }
  if (hint < count && SameButResults(db.schema(), db.record(hint), bytes)) return static_cast<long>(hint);
  for (size_t i = 0; i < count; ++i) {
    if (SameButResults(db.schema(), db.record(i), bytes)) return static_cast<long>(i);
  }
  return -1;
}

void RecordHistory::Push(RecordStep step) {
  undo_.push_back(std::move(step));
  if (undo_.size() > kMaxSteps) undo_.pop_front();
  redo_.clear();
}

long RecordHistory::Undo(DataSession& session) {
  if (undo_.empty()) return -1;
  RecordStep step = std::move(undo_.back());
  undo_.pop_back();
  const long index = Apply(session, step, false);
  if (index != -2) redo_.push_back(std::move(step));
  return index < 0 ? -1 : index;
}

long RecordHistory::Redo(DataSession& session) {
  if (redo_.empty()) return -1;
  RecordStep step = std::move(redo_.back());
  redo_.pop_back();
  const long index = Apply(session, step, true);
  if (index != -2) undo_.push_back(std::move(step));
  return index < 0 ? -1 : index;
}

void RecordHistory::Clear() {
  undo_.clear();
  redo_.clear();
}

}  // namespace cx
