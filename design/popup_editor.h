// The logic of the "Edit Popup List" dialog: a working copy of one field's
// popup entries, shown in entry order or sorted, edited by New, Rename and
// Delete, and written back on OK. Deleting an entry of a Pop-Up field
// renumbers the records at once, whatever the dialog's outcome.
#pragma once

#include <string>
#include <vector>

#include "engine/record_store.h"
#include "ops/session.h"
#include "platform/ui_port.h"

namespace cx {

namespace popup_messages {
inline constexpr const char* kTooMany = "You have reached the maximum number of popups allowed!";
inline constexpr const char* kEmptyValue = "You must first enter a value for this popup entry!";
inline constexpr const char* kEditPopupPrompt = "Enter New Popup Value";
}  // namespace popup_messages

// The "Edit Popup" dialog's OK: false (after the message) for an empty
// value, so that the dialog stays open; otherwise the value cut to 79
// characters.
bool AcceptPopupValue(std::string& value, UiPort& ui);

// The view order of entries: positions in the list to entry indexes.
// Sorted, Integer and Float fields compare their entries as numbers and all
// other types as text (case ignored; equal entries keep entry order).
std::vector<int> PopupViewOrder(const std::vector<std::string>& entries, FieldType type,
                                bool sorted);

class PopupEditor {
 public:
  // Opening: the working copy is loaded from the field's stored entries.
  PopupEditor(DataSession& session, int slot);

  const std::vector<std::string>& entries() const { return entries_; }
  bool sorted() const { return sorted_; }
  // The texts the list shows, in view order, and the entry index at a
  // list position (-1 when there is none).
  std::vector<std::string> ListTexts() const;
  int EntryAt(int position) const;
  // The list position of an entry (-1 when there is none).
  int PositionOf(int entry) const;

  // "New": refused with a message when 60 entries are there already;
  // otherwise `value` goes through the "Edit Popup" dialog's check and is
  // appended. True when appended.
  bool New(std::string value);
  // "Rename" of the entry at list `position`: replaced in place (its index
  // is unchanged). False without a selection or for an empty value.
  bool Rename(int position, std::string value);
  // "Delete" of the entry at list `position`. For a Pop-Up field every
  // record is corrected at once and calculated fields using the field are
  // recalculated; that stays even if the dialog is cancelled.
  bool Delete(int position);
  // "Sort Popups": stored in the schema at once.
  void SetSorted(bool on);

  // OK: the working copy replaces the stored entries. (Cancel: drop the
  // editor; nothing more happens.)
  void Commit();

 private:
  DataSession& session_;
  int slot_;
  std::vector<std::string> entries_;
  bool sorted_ = false;
};

// Corrects every record of `db` after entry `deleted` of Pop-Up field
// `slot` went: that index becomes "No Value" (255), higher ones move down
// by one; records that do not change are not rewritten. Returns how many
// records changed.
size_t RenumberAfterPopupDelete(Database& db, int slot, int deleted);

// "Popups Append" from the record editor: adds a typed value to the
// field's list after the "Edit Popups" access check. Returns the entry's
// index (an existing equal entry's when there is one), or -1 when refused,
// empty, or the list is full (the message is shown).
int AppendPopupValue(Database& db, int slot, const std::string& value, UiPort& ui);

}  // namespace cx
