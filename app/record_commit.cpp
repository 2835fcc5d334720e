#include "app/record_commit.h"

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

#include "design/security.h"
#include "ops/calc.h"
#include "ops/compare.h"
#include "ops/field_values.h"
#include "ops/links.h"
#include "ops/sort.h"
#include "ops/view.h"

namespace cx {
namespace {

// True when some Calculated field reads `field` (from this record or the
// previous one).
bool FeedsCalculation(const Schema& schema, int field) {
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (!IsCalculated(schema, f)) continue;
    if (CalcOperand1(schema.field[f]).field == field || CalcOperand2(schema.field[f]).field == field) {
      return true;
    }
  }
  return false;
}

// A full pass may sort the table again (a Calculated sort key): follow the
// record to wherever it went.
size_t Relocate(const Database& db, const Bytes& expected, size_t index) {
  if (index < db.recordCount()) {
    ByteView now = db.record(index);
    if (std::equal(now.begin(), now.end(), expected.begin(), expected.end())) return index;
  }
  const long found = FindRecord(db, expected, index);
  return found >= 0 ? static_cast<size_t>(found) : index;
}

// The sorted place of a record just changed: the first of the other
// records that it sorts before, as RepositionRecord finds it, but found by
// halving, since the others are in order. An edit near the end of a large
// table then costs no more than one near its start.
size_t PlaceRecord(Database& db, size_t index) {
  const auto& keys = db.schema().sortKey;
  const bool anyKey = std::any_of(keys.begin(), keys.end(), [](const SortKey& k) { return k.Field() >= 0; });
  ByteView record = db.record(index);
  if (!anyKey || record.empty()) return index;
  auto other = [&](size_t i) { return db.record(i < index ? i : i + 1); };
  size_t lo = 0;
  size_t hi = db.recordCount() - 1;
  while (lo < hi) {
    const size_t mid = lo + (hi - lo) / 2;
    if (ComparePlacement(db, record, other(mid)) < 0) {
      hi = mid;
    } else {
      lo = mid + 1;
    }
  }
  if (lo != index) db.MoveRecord(index, lo);
  return lo;
}

void Finish(DataSession& session) {
  session.calc.fieldChanged.fill(0);
  session.view = RebuildView(session.db, session.Link());
  session.db.MarkChanged();
}

}  // namespace

StoreOutcome StoreRecord(DataSession& session, size_t index, Bytes stored,
                         const std::array<bool, format::kFieldCount>& changed, bool inPlace,
                         RecordHistory* history) {
  Database& db = session.db;
  StoreOutcome out;
  RecordStep step;
  const bool adding = index == kNewRecordIndex;
  if (adding) {
    if (!db.CanAddRecord() || stored.size() > format::kMaxRecordSize) {
      session.ui.ShowMessage(record_messages::kSavingError, "ERROR", MessageIcon::Error);
      return out;
    }
    step.kind = RecordStep::Kind::Add;
    index = db.recordCount();
    db.AppendRecord(std::move(stored));
  } else {
    if (index >= db.recordCount() || stored.size() > format::kMaxRecordSize) {
      session.ui.ShowMessage(record_messages::kSavingError, "ERROR", MessageIcon::Error);
      return out;
    }
    step.kind = RecordStep::Kind::Change;
    ByteView before = db.record(index);
    step.before.assign(before.begin(), before.end());
    step.beforeIndex = index;
    db.ReplaceRecord(index, std::move(stored));
  }

  for (int f = 0; f < format::kFieldCount; ++f) {
    if (changed[f]) session.calc.fieldChanged[f] = 1;
  }
  if (HasCalculatedField(db.schema())) RecalculateRecord(session, index);
  const size_t oldIndex = index;
  if (!inPlace) index = PlaceRecord(db, index);
  ByteView placed = db.record(index);
  Bytes expected(placed.begin(), placed.end());
  RecalculateAfterMove(session, adding ? oldIndex : step.beforeIndex, index);
  index = Relocate(db, expected, index);
  Finish(session);

  if (history) {
    ByteView after = db.record(index);
    step.after.assign(after.begin(), after.end());
    step.afterIndex = index;
    step.inPlace = inPlace;
    history->Push(std::move(step));
  }
  out.ok = out.stored = true;
  out.index = index;
  return out;
}

bool AppendTypedToPopups(RecordForm& form) {
  Database& db = form.session().db;
  const Schema& schema = db.schema();
  std::vector<std::pair<int, std::string>> wanted;
  for (int f = 0; f < format::kFieldCount; ++f) {
    const FieldDef& def = schema.field[f];
    const FieldType type = def.type();
    if (!def.popupsAppend || !form.Modified(f)) continue;
    if (type != FieldType::Text && type != FieldType::Note && type != FieldType::Integer &&
        type != FieldType::Float) {
      continue;
    }
    std::string text = form.Text(f);
    if (text.empty()) continue;
    if (text.size() > format::kMaxPopupText) text.resize(format::kMaxPopupText);
    const auto& items = db.popups()[f].items;
    if (std::find(items.begin(), items.end(), text) != items.end()) continue;
    if (items.size() >= static_cast<size_t>(format::kMaxPopupItems)) continue;
    wanted.emplace_back(f, std::move(text));
  }
  if (wanted.empty()) return false;
  // The record is saved either way; only the lists wait for the check.
  if (!Allowed(CheckAccess(db, secured::kEditPopups, form.session().ui))) return false;
  for (auto& [field, text] : wanted) db.popups()[field].items.push_back(std::move(text));
  db.MarkChanged();
  return true;
}

StoreOutcome CommitForm(RecordForm& form, RecordHistory* history) {
  if (!form.isNew() && !form.AnyModified()) {
    StoreOutcome unchanged;
    unchanged.ok = true;
    unchanged.index = form.index();
    return unchanged;
  }
  form.PrepareForSave();
  return StoreRecord(form.session(), form.index(), form.Stored(), form.ModifiedFields(), false,
                     history);
}

int InPlaceEdit(DataSession& session, size_t index, int field,
                const std::function<void(RecordForm&)>& change, const Clock& clock,
                RecordHistory* history) {
  if (index >= session.db.recordCount() || field < 0 || field >= format::kFieldCount) return -1;
  RecordForm form(session, index, clock);
  change(form);
  if (!form.Modified(field)) return 0;
  std::array<bool, format::kFieldCount> changed{};
  changed[field] = true;
  Bytes stored = SpliceRecord(session.db.record(index), form.editing(), session.db.schema(), changed);
  if (!FeedsCalculation(session.db.schema(), field)) {
    // Nothing reads the field: the record alone changes.
    RecordStep step;
    ByteView before = session.db.record(index);
    step.before.assign(before.begin(), before.end());
    step.after = stored;
    step.beforeIndex = step.afterIndex = index;
    step.inPlace = true;
    session.db.ReplaceRecord(index, std::move(stored));
    Finish(session);
    if (history) history->Push(std::move(step));
    return 0;
  }
  return StoreRecord(session, index, std::move(stored), changed, true, history).ok ? 0 : -1;
}

void DeleteRecordAt(DataSession& session, size_t index, RecordHistory* history) {
  Database& db = session.db;
  if (index >= db.recordCount()) return;
  RecordStep step;
  step.kind = RecordStep::Kind::Delete;
  ByteView before = db.record(index);
  step.before.assign(before.begin(), before.end());
  step.beforeIndex = index;
  step.attributes = db.entry(index).attributes();
  step.uniqueID = db.entry(index).uniqueID();
  db.DeleteRecord(index);
  RecalculateAfterMove(session, index, index + 1);
  Finish(session);
  if (history) history->Push(std::move(step));
}

bool DeleteRecordCommand(DataSession& session, size_t index, LinkedRecordDeleter* linked,
                         RecordHistory* history) {
  if (index >= session.db.recordCount()) return false;
  if (!Allowed(CheckAccess(session.db, secured::kDeleteRecords, session.ui))) return false;
  if (!session.ui.AskYesNo(record_messages::kConfirmDelete, record_messages::kConfirmDeleteCaption)) {
    return false;
  }
  if (linked && HasLinkFields(session.db) &&
      session.ui.AskYesNo(link_messages::kDeleteLinkedQuestion, "QUESTION")) {
    linked->DeleteLinkedTo(session.db, index);
  }
  DeleteRecordAt(session, index, history);
  return true;
}

}  // namespace cx
