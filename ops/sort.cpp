#include "ops/sort.h"

#include <algorithm>
#include <cstdio>
#include <utility>
#include <vector>

#include "ops/calc.h"
#include "ops/compare.h"
#include "ops/field_values.h"
#include "ops/sort_keys.h"

namespace cx {
namespace {

constexpr const char* kCannotSortType = "This type of field (%s) cannot currently be sorted!";
constexpr const char* kCannotSortRelative =
    "Since this field (%s) references other records, it's value is relative to it's position, "
    "meaning that it cannot be the basis for a sort!";

bool AnyKeySet(const Schema& schema) {
  return std::any_of(schema.sortKey.begin(), schema.sortKey.end(),
                     [](const SortKey& k) { return k.Field() != -1; });
}

// A Calculated field whose value comes, directly or through the Calculated
// fields it uses, from the previous record.
bool UsesOtherRecords(const Schema& schema, int field, std::array<bool, format::kFieldCount>& seen) {
  if (!IsCalculated(schema, field) || seen[field]) return false;
  seen[field] = true;
  const FieldDef& def = schema.field[field];
  if (def.calcFlags & 3) return true;
  for (const CalcOperand& op : {CalcOperand1(def), CalcOperand2(def)}) {
    if (op.IsField() && UsesOtherRecords(schema, op.field, seen)) return true;
  }
  return false;
}

std::string FieldName(const Schema& schema, int field) {
  if (field < 0 || field >= format::kFieldCount) return std::to_string(field);
  return schema.field[field].name.str();
}

void StoreKeyField(SortKey& key, int field) {
  key.field = static_cast<uint8_t>(static_cast<int8_t>(field));
}

}  // namespace

void ShowErrorBox(UiPort& ui, const std::string& text) {
  ui.ShowMessage(text + "\n", "ERROR!", MessageIcon::Error);
}

void SortAll(Database& db) {
  const size_t count = db.recordCount();
  if (db.schema().sortKey[0].Field() == -1 || count < 2) return;
  SortKeyTable keys(db);
  keys.Sort();
  RecordTable& table = db.table();
  RecordTable sorted;
  sorted.reserve(count);
  for (size_t i = 0; i < count; ++i) sorted.push_back(std::move(table[keys.RecordAt(i)]));
  table.swap(sorted);
  db.MarkChanged();
}

void SortAll(DataSession& session, bool rebuildView) {
  session.ui.SetBusy(true);
  SortAll(session.db);
  if (rebuildView) session.view = RebuildView(session.db, session.Link());
  session.ui.SetBusy(false);
}

size_t RepositionRecord(Database& db, size_t index) {
  const size_t count = db.recordCount();
  if (!AnyKeySet(db.schema()) || index >= count || db.record(index).empty()) return index;
  ByteView changed = db.record(index);
  for (size_t p = 0; p < count; ++p) {
    if (p == index) continue;
    ByteView other = db.record(p);
    if (other.empty()) return index;
    if (ComparePlacement(db, changed, other) < 0) {
      const size_t target = p > index ? p - 1 : p;
      db.MoveRecord(index, target);
      return target;
    }
  }
  if (index != count - 1) db.MoveRecord(index, count - 1);
  return count - 1;
}

size_t InsertionPlace(Database& db, size_t count) {
  if (count >= db.recordCount()) return count;
  ByteView added = db.record(count);
  for (size_t p = 0; p < count; ++p) {
    ByteView other = db.record(p);
    if (other.empty()) return count;
    if (ComparePlacement(db, added, other) < 0) {
      db.MoveRecord(count, p);
      return p;
    }
  }
  return count;
}

int CheckSortable(const Database& db, int field, UiPort* report) {
  if (field == -1) return 1;
  const Schema& schema = db.schema();
  const FieldType type = field >= 0 && field < format::kFieldCount ? schema.field[field].type()
                                                                  : FieldType::NotUsed;
  const char* reason = nullptr;
  if (type == FieldType::NotUsed || type == FieldType::Image || type == FieldType::Link ||
      type == FieldType::Heading) {
    reason = kCannotSortType;
  } else if (type == FieldType::Calculated) {
    std::array<bool, format::kFieldCount> seen{};
    if (UsesOtherRecords(schema, field, seen)) reason = kCannotSortRelative;
  }
  if (!reason) return 1;
  if (report) ShowErrorBox(*report, FormatMessage(reason, FieldName(schema, field)));
  return 0;
}

SortingChoice OpenSortingDialog(const Schema& schema) {
  SortingChoice choice;
  for (int k = 0; k < 3; ++k) {
    const int field = schema.sortKey[k].Field();
    choice.entry[k] = field >= 0 && field < format::kFieldCount ? field + 1 : 0;
    choice.forward[k] = schema.sortKey[k].direction != 0;
  }
  return choice;
}

bool AcceptSortingDialog(Database& db, const SortingChoice& choice, UiPort& ui) {
  for (int k = 0; k < 3; ++k) {
    if (!CheckSortable(db, choice.entry[k] - 1, &ui)) return false;
  }
  Schema& schema = db.schema();
  for (int k = 0; k < 3; ++k) StoreKeyField(schema.sortKey[k], choice.entry[k] - 1);
  schema.sortKey[0].direction = choice.forward[0] ? 1 : 0;
  schema.sortKey[1].direction = choice.forward[1] ? 1 : 0;
  // Deliberately the primary pair's button: the tertiary direction follows
  // the primary one, as files written on the handheld expect.
  schema.sortKey[2].direction = choice.forward[0] ? 1 : 0;
  db.MarkChanged();
  return true;
}

void SortAfterDialog(DataSession& session) {
  SortAll(session, false);
  RecalculateAfterMove(session, 0, 1);
  session.view = RebuildView(session.db, session.Link());
}

void SortFromHeader(DataSession& session, int field, bool forward) {
  Schema& schema = session.db.schema();
  StoreKeyField(schema.sortKey[0], field);
  schema.sortKey[0].direction = forward ? 1 : 0;
  StoreKeyField(schema.sortKey[1], -1);
  StoreKeyField(schema.sortKey[2], -1);
  SortAll(session, false);
  RecalculateAfterMove(session, 0, 1);
  session.view = RebuildView(session.db, session.Link());
  session.db.MarkChanged();
}

bool ParseSortKeyText(const Schema& schema, std::string_view text, int& field, bool& forward,
                      std::string& error) {
  forward = true;
  std::string_view name = text;
  if (size_t colon = text.rfind(':'); colon != std::string_view::npos) {
    std::string suffix = LowerAscii(text.substr(colon + 1));
    if (suffix == "reverse" || suffix == "forward") {
      forward = suffix == "forward";
      name = text.substr(0, colon);
    }
  }
  const bool digits = !name.empty() && name.size() <= 2 &&
                      std::all_of(name.begin(), name.end(), [](char c) { return c >= '0' && c <= '9'; });
  if (digits) {
    field = std::stoi(std::string(name));
    if (field < format::kFieldCount) return true;
  }
  for (bool exact : {true, false}) {
    for (int f = 0; f < format::kFieldCount; ++f) {
      const std::string candidate = schema.field[f].name.str();
      if (exact ? candidate == name : CompareNoCase(candidate, name) == 0) {
        field = f;
        return true;
      }
    }
  }
  error = "No field \"" + std::string(name) + "\": give a slot number 0-29 or a field name";
  return false;
}

}  // namespace cx
