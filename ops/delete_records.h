// "Delete Records": deleting the records within the filter range, outside
// it, or all of them.
#pragma once

#include <cstddef>

#include "engine/record_store.h"
#include "ops/session.h"

namespace cx {

enum class DeleteScope {
  WithinFilterRange = 0,   // "All Records _Within_ Filter Range"
  OutsideFilterRange = 1,  // "All Records _Outside_ Filter Range"
  All = 2,                 // "All Records"
};

// Deletes, in the other databases, the records linked to record `index` of
// `db`, which is about to be deleted (ops/links.h DeleteLinkedRecords does
// the work; the caller supplies what it needs).
class LinkedRecordDeleter {
 public:
  virtual ~LinkedRecordDeleter() = default;
  virtual void DeleteLinkedTo(const Database& db, size_t index) = 0;
};

// DeleteRecords: deletes the records of the scope, in table order; with
// `alsoLinked`, the records linked to each one are deleted first. Then the
// view is rebuilt and the recalculation after a move from index 0 runs.
// Returns the number of records deleted. The "Delete Records" access check
// is the caller's.
size_t DeleteRecords(DataSession& session, DeleteScope scope, LinkedRecordDeleter* alsoLinked);

// The main view's command after the dialog's OK: when the database has Link
// fields and `linked` is given, asks "Would you like to delete the linked
// records also? (Y/N)" to decide whether they go too, then deletes.
size_t DeleteRecordsCommand(DataSession& session, DeleteScope scope, LinkedRecordDeleter* linked);

}  // namespace cx
