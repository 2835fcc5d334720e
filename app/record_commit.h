// Writing one record back with every follow-up step: the editor's OK, an
// in-place edit in the list, "Delete Record". Each step of the work is the
// same for the three so that the table, the calculated fields and the view
// never disagree, and each change is kept for undo.
#pragma once

#include <array>
#include <cstddef>
#include <functional>

#include "app/record_form.h"
#include "app/record_history.h"
#include "ops/delete_records.h"
#include "ops/session.h"

namespace cx {

namespace record_messages {
inline constexpr const char* kSavingError = "ERROR: Saving record!";
inline constexpr const char* kConfirmDelete = "Are you sure you want to delete this record?";
inline constexpr const char* kConfirmDeleteCaption = "Confirm Delete";
inline constexpr const char* kLinkedNotPresent = "Linked Database is not present on this device!";
}  // namespace record_messages

struct StoreOutcome {
  bool ok = false;
  bool stored = false;  // false when there was nothing to write
  size_t index = 0;     // where the record stands now
};

// Stores `stored` as record `index` (or appends it for kNewRecordIndex),
// moves it to its sorted place unless `inPlace`, marks `changed` fields for
// the recalculation, recalculates the record and what depends on it, clears
// the marks, rebuilds the view and marks the database changed. A record
// that cannot be added shows "ERROR: Saving record!" and changes nothing.
StoreOutcome StoreRecord(DataSession& session, size_t index, Bytes stored,
                         const std::array<bool, format::kFieldCount>& changed, bool inPlace,
                         RecordHistory* history);

// The editor's OK: the values that saving fills in, then StoreRecord. An
// existing record the user did not change is left alone (nothing written,
// the database not marked).
StoreOutcome CommitForm(RecordForm& form, RecordHistory* history);

// Texts typed into Text, Note, Integer and Float fields whose "Popups
// Append" is on, and which their popup lists lack: added to those lists
// (while a list has room) after one "Edit Popups" check. True when a list
// changed. Runs before the form is committed, on the values as typed.
bool AppendTypedToPopups(RecordForm& form);

// The common frame of an in-place edit: the record is read into a form,
// `change` edits it, and it is written back where it stands. 0, or -1 when
// there is no such record; a change that leaves the value as it was
// writes nothing.
int InPlaceEdit(DataSession& session, size_t index, int field,
                const std::function<void(RecordForm&)>& change, const Clock& clock,
                RecordHistory* history);

// "Delete Record": the "Delete Records" access check, "Are you sure you
// want to delete this record?", and when the database has Link fields and
// `linked` is given, whether the linked records go too. True when the
// record was deleted (the view is rebuilt and the recalculation done).
bool DeleteRecordCommand(DataSession& session, size_t index, LinkedRecordDeleter* linked,
                         RecordHistory* history);

// Deletes record `index` with the follow-up work, no questions.
void DeleteRecordAt(DataSession& session, size_t index, RecordHistory* history);

}  // namespace cx
