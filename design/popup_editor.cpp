#include "design/popup_editor.h"

#include <algorithm>
#include <numeric>

#include "design/recalculate.h"
#include "design/security.h"
#include "ops/database_settings.h"
#include "ops/field_values.h"

namespace cx {

bool AcceptPopupValue(std::string& value, UiPort& ui) {
  if (value.empty()) {
    ui.ShowMessage(popup_messages::kEmptyValue, "ERROR", MessageIcon::Warning);
    return false;
  }
  if (value.size() > format::kMaxPopupText) value.resize(format::kMaxPopupText);
  return true;
}

std::vector<int> PopupViewOrder(const std::vector<std::string>& entries, FieldType type,
                                bool sorted) {
  std::vector<int> order(entries.size());
  std::iota(order.begin(), order.end(), 0);
  if (!sorted) return order;
  if (type == FieldType::Integer || type == FieldType::Float) {
    std::stable_sort(order.begin(), order.end(), [&](int a, int b) {
      return ParseDouble(entries[a]) < ParseDouble(entries[b]);
    });
  } else {
    std::stable_sort(order.begin(), order.end(), [&](int a, int b) {
      return CompareNoCase(entries[a], entries[b]) < 0;
    });
  }
  return order;
}

PopupEditor::PopupEditor(DataSession& session, int slot)
    : session_(session), slot_(slot), sorted_(SortPopupsOn(session.db.schema(), slot)) {
  const auto& items = session.db.popups()[slot].items;
  const size_t n = std::min<size_t>(items.size(), format::kMaxPopupItems);
  entries_.assign(items.begin(), items.begin() + static_cast<std::ptrdiff_t>(n));
}

std::vector<std::string> PopupEditor::ListTexts() const {
  std::vector<std::string> out;
  for (int e : PopupViewOrder(entries_, session_.db.schema().field[slot_].type(), sorted_)) {
    out.push_back(entries_[e].substr(0, format::kMaxPopupText));
  }
  return out;
}

int PopupEditor::EntryAt(int position) const {
  auto order = PopupViewOrder(entries_, session_.db.schema().field[slot_].type(), sorted_);
  return position >= 0 && position < static_cast<int>(order.size()) ? order[position] : -1;
}

int PopupEditor::PositionOf(int entry) const {
  auto order = PopupViewOrder(entries_, session_.db.schema().field[slot_].type(), sorted_);
  auto it = std::find(order.begin(), order.end(), entry);
  return it == order.end() ? -1 : static_cast<int>(it - order.begin());
}

bool PopupEditor::New(std::string value) {
  if (entries_.size() >= static_cast<size_t>(format::kMaxPopupItems)) {
    session_.ui.ShowMessage(popup_messages::kTooMany, "ERROR", MessageIcon::Warning);
    return false;
  }
  if (!AcceptPopupValue(value, session_.ui)) return false;
  entries_.push_back(std::move(value));
  return true;
}

bool PopupEditor::Rename(int position, std::string value) {
  const int entry = EntryAt(position);
  if (entry < 0 || !AcceptPopupValue(value, session_.ui)) return false;
  entries_[entry] = std::move(value);
  return true;
}

bool PopupEditor::Delete(int position) {
  const int entry = EntryAt(position);
  if (entry < 0) return false;
  entries_.erase(entries_.begin() + entry);
  Database& db = session_.db;
  if (db.schema().field[slot_].type() == FieldType::PopUp) {
    RenumberAfterPopupDelete(db, slot_, entry);
    if (CalculationsUse(db.schema(), slot_)) RecalculateAfterDesignChange(session_);
  }
  return true;
}

void PopupEditor::SetSorted(bool on) {
  sorted_ = on;
  SetSortPopups(session_.db.schema(), slot_, on);
  session_.db.MarkChanged();
}

void PopupEditor::Commit() {
  session_.db.popups()[slot_].items = entries_;
  session_.db.MarkChanged();
}

size_t RenumberAfterPopupDelete(Database& db, int slot, int deleted) {
  size_t changed = 0;
  for (size_t i = 0; i < db.recordCount(); ++i) {
    ByteView record = db.record(i);
    const int at = FieldOffset(slot, record);
    if (at < 0 || FieldLength(record, slot) < 1 || static_cast<size_t>(at) >= record.size()) {
      continue;
    }
    const uint8_t index = record[at];
    if (index == format::kNoPopupValue || index < deleted) continue;
    Bytes copy(record.begin(), record.end());
    copy[at] = index == deleted ? format::kNoPopupValue : static_cast<uint8_t>(index - 1);
    db.ReplaceRecord(i, std::move(copy));
    ++changed;
  }
  return changed;
}

int AppendPopupValue(Database& db, int slot, const std::string& value, UiPort& ui) {
  if (value.empty()) return -1;
  std::string text = value.substr(0, format::kMaxPopupText);
  auto& items = db.popups()[slot].items;
  for (size_t i = 0; i < items.size(); ++i) {
    if (items[i] == text) return static_cast<int>(i);
  }
  if (items.size() >= static_cast<size_t>(format::kMaxPopupItems)) {
    ui.ShowMessage(popup_messages::kTooMany, "ERROR", MessageIcon::Warning);
    return -1;
  }
  if (!Allowed(CheckAccess(db, secured::kEditPopups, ui))) return -1;
  items.push_back(std::move(text));
  db.MarkChanged();
  return static_cast<int>(items.size() - 1);
}

}  // namespace cx
