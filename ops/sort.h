// Keeping the record table in the order of the three sort keys: sorting the
// whole table, placing one record, the sortability check, and the two ways
// the user sets the keys (the "Sorting" dialog and the column-header menu).
#pragma once

#include <array>
#include <string>
#include <string_view>

#include "engine/record_store.h"
#include "ops/session.h"
#include "platform/ui_port.h"

namespace cx {

// SortAll: sorts the record table on the schema's sort keys and marks the
// database changed. Does nothing when the primary key is -1 or there are
// fewer than two records. Records that compare equal on every key may end
// up in any order.
void SortAll(Database& db);
// The same with the wait cursor shown; with `rebuildView` the session's
// view list is rebuilt afterwards.
void SortAll(DataSession& session, bool rebuildView);

// RepositionRecord: moves record `index`, just changed, to its sorted place
// and returns its new index (unchanged when no key is set).
size_t RepositionRecord(Database& db, size_t index);

// InsertionPlace: the record at index `count` was appended; moves it before
// the first of the records 0 .. count - 1 that it sorts before and returns
// its new index.
size_t InsertionPlace(Database& db, size_t count);

// CheckSortable: 1 when `field` may be a sort key (-1, "No Field", always
// may), 0 when not. With `report` the reason is shown in the error box.
int CheckSortable(const Database& db, int field, UiPort* report);

// The error box of the data operations: caption "ERROR!", a line feed
// appended to the text.
void ShowErrorBox(UiPort& ui, const std::string& text);

// The "Sorting" dialog's three lists and radio-button pairs.
struct SortingChoice {
  std::array<int, 3> entry{};     // 0 "No Field", n + 1 for field n
  std::array<bool, 3> forward{};  // the pair's "Forward" button is checked
};

// What the dialog shows on opening.
SortingChoice OpenSortingDialog(const Schema& schema);

// The dialog's OK: checks the three choices in order and, at the first that
// cannot be sorted, shows why and returns false (the dialog stays open,
// nothing is stored). Otherwise stores the keys (the tertiary direction
// follows the primary "Forward" button), marks the database changed and
// returns true; the caller then runs SortAfterDialog.
bool AcceptSortingDialog(Database& db, const SortingChoice& choice, UiPort& ui);

// After the dialog's OK: sorts, recalculates what the new order affects and
// rebuilds the view.
void SortAfterDialog(DataSession& session);

// "Sort Forward" / "Sort Reverse" of a column's header menu: the column's
// field becomes the only key, the table is sorted and recalculated and the
// view rebuilt. No sortability check is made.
void SortFromHeader(DataSession& session, int field, bool forward);

// A sort key as the command line writes it: a slot number 0-29 or a field
// name (case ignored), optionally followed by ":reverse" or ":forward".
// False with `error` set when it names no field.
bool ParseSortKeyText(const Schema& schema, std::string_view text, int& field, bool& forward,
                      std::string& error);

}  // namespace cx
