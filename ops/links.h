// Linked databases: a Link field names another database in the same folder
// and a field of it; the records of that database whose field holds the
// parent record's link value are the parent's linked records. Opening such
// a database restricted to those records, deleting them with their parent,
// and copying or moving records to another database of the same design.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "ops/delete_records.h"
#include "ops/session.h"
#include "ops/view.h"
#include "platform/clock.h"
#include "platform/ui_port.h"

namespace cx {

// The guarded operations that linked work stands for; the numbers are the
// access check's operation numbers.
enum class LinkAccess { Open = 0, Add = 1, Edit = 2, Delete = 3 };

// What linked work needs from the layers above: the user, the access check,
// and the databases that are already open (the view levels).
struct LinkServices {
  explicit LinkServices(UiPort& userInterface) : ui(userInterface) {}
  UiPort& ui;
  // The access check for `kind` on `db`: false when refused (the check has
  // shown its message). Empty: everything is allowed.
  std::function<bool(const Database& db, LinkAccess kind)> checkAccess;
  // The check made when a database file has just been loaded for linked
  // work (its "Open Database" level). Empty: allowed.
  std::function<bool(const Database& db)> checkOpen;
  // A database already open in memory at `path`, or nullptr. Empty: none.
  std::function<Database*(const std::string& path)> findOpen;
  const Clock* clock = nullptr;  // for saving; the default clock when null
  // The regional settings for the work a file still owes when it is
  // loaded here (re-sorting, recalculating); null: that work waits for the
  // database's next opening.
  const LocaleInfo* locale = nullptr;
  // The databases a walk through links is inside of, outermost first, so
  // that a link leading back to one of them is not followed again. Kept by
  // ForEachLinkedRecord while it visits; starts and ends empty.
  mutable std::vector<std::string> visiting;

  const Clock& SaveClock() const { return clock ? *clock : DefaultClock(); }
};

// The link restriction of a linked database plus what the parent record
// contributes: its index and its 20-byte prefix extension (empty when the
// record has none).
struct LinkContext {
  LinkRestriction restriction;
  size_t parentIndex = 0;
  std::string parentHeaderText;
};

// A linked database ready for use: either one that was already open (owned
// elsewhere) or one loaded here (owned by this object, saved by Close).
class LinkedDatabase {
 public:
  LinkedDatabase() = default;
  LinkedDatabase(Database* shared, LinkContext context);
  LinkedDatabase(std::unique_ptr<Database> owned, LinkContext context);
  LinkedDatabase(LinkedDatabase&&) = default;
  LinkedDatabase& operator=(LinkedDatabase&&) = default;

  explicit operator bool() const { return db_ != nullptr; }
  Database& db() const { return *db_; }
  const LinkContext& context() const { return context_; }
  const LinkRestriction& restriction() const { return context_.restriction; }
  bool loadedHere() const { return owned_ != nullptr; }
  // Hands the loaded database over (for a view level that keeps it).
  std::unique_ptr<Database> Release() { return std::move(owned_); }

  // Saves a database loaded here when it changed (showing the failure)
  // and lets it go. Databases that were already open are left to their
  // owner. False when the save failed.
  bool Close(const LinkServices& services);

 private:
  Database* db_ = nullptr;
  std::unique_ptr<Database> owned_;
  LinkContext context_;
};

// OpenLinkedDatabase: the database named by Link field `fieldSlot` of
// `db`, looked for beside `db`'s file, with the restriction of record
// `recordIndex`. Messages: "Linked Database is not present in this
// folder!" and "Unable to open Linked Database in this user's folder!"
// (both "ERROR"). Empty when the file is missing, cannot be opened or the
// access check for `kind` refuses.
LinkedDatabase OpenLinkedDatabase(int fieldSlot, const Database& db, size_t recordIndex,
                                  LinkAccess kind, const LinkServices& services);

// The restriction a record of `db` puts on the database its Link field
// `fieldSlot` names (without opening it).
LinkContext MakeLinkContext(int fieldSlot, const Database& db, size_t recordIndex);

// Indexes of the records of `linked` that pass the view test with both
// filters switched off and `restriction` applied, in table order.
std::vector<size_t> LinkedRecordIndexes(const Database& linked, const LinkRestriction& restriction);

// True when two paths name the same database file (case ignored, as on the
// handheld).
bool SameDatabasePath(const std::string& a, const std::string& b);

// HasLinkFields: true when any of the 30 fields is a Link field.
bool HasLinkFields(const Database& db);

// DeleteLinkedRecords: deletes, recursively, every record linked to record
// `recordIndex` of `db` (through each Link field, in display order), each
// linked database under its "Delete Records" access check. Databases
// already being worked on higher up the chain are not entered again, so
// links that lead back do not loop. Returns the number of records deleted.
size_t DeleteLinkedRecords(size_t recordIndex, const Database& db, const LinkServices& services);

// Calls `visit` for each record linked to record `recordIndex` of `db`
// through Link field `fieldSlot` (filters off, table order). False when the
// linked database could not be opened (the field is then skipped), or when
// it is one the walk is already inside of (a visit that lists records with
// links of their own comes back here, and links leading back end). The
// database is let go unsaved. Used by listings.
bool ForEachLinkedRecord(size_t recordIndex, const Database& db, int fieldSlot,
                         const LinkServices& services,
                         const std::function<void(const Database& linked, size_t index)>& visit);

// DeleteRecords' way to the linked records: DeleteLinkedRecords with these
// services.
class LinkedRecordsDeleter : public LinkedRecordDeleter {
 public:
  explicit LinkedRecordsDeleter(const LinkServices& services) : services_(services) {}
  void DeleteLinkedTo(const Database& db, size_t index) override {
    DeleteLinkedRecords(index, db, services_);
  }

 private:
  const LinkServices& services_;
};

// Which records a transfer takes: all records in view (the source
// session's view test, its link restriction included) or one.
struct TransferWhich {
  bool allInView = true;
  size_t index = 0;  // the one record when !allInView
};

struct TransferResult {
  int code = 0;          // 1: the target was the source itself (copy only); 0 otherwise
  bool done = false;     // false when refused or cancelled before any record moved
  bool failed = false;   // the target could not be saved: the source lost nothing
  size_t copied = 0;
  size_t deleted = 0;    // records removed from the source (moving)
};

// TransferRecords: asks for the target with the open-file dialog, then
// TransferRecordsTo.
TransferResult TransferRecords(bool move, const TransferWhich& which, DataSession& source,
                               const LinkServices& services);

// Copies (or moves) records of the source to the database at `targetPath`.
// The same database is refused for a move ("ERROR: Cannot perform this
// operation to the same database") and duplicates records for a copy; a
// target whose 30 field types differ is refused ("ERROR: Field Types of
// Database:%s do not match that of this database!"). The target must pass
// its "Add Records" check; each record moved must pass the source's
// "Delete Records" check before it is removed. Records added to another
// database mark it for re-sorting and recalculation at its next opening;
// added to the source itself they are placed and calculated at once. A
// target loaded here is saved before any record is removed from the
// source; when that save fails its message is shown and nothing is removed
// (`failed`). After a move the source is recalculated and its view rebuilt.
TransferResult TransferRecordsTo(bool move, const TransferWhich& which, DataSession& source,
                                 const std::string& targetPath, const LinkServices& services);

// ShowNotice: the three texts joined; kind 0 a box titled "UPDATE", kind 1
// a Yes/No question titled "QUESTION" giving 1 when the answer is not Yes.
int ShowNotice(int kind, const std::string& text1, const std::string& text2,
               const std::string& text3, UiPort& ui);

namespace link_messages {
inline constexpr const char* kNotPresent = "Linked Database is not present in this folder!";
inline constexpr const char* kCannotOpen = "Unable to open Linked Database in this user's folder!";
inline constexpr const char* kSameDatabase =
    "ERROR: Cannot perform this operation to the same database";
inline constexpr const char* kTypesDiffer =
    "ERROR: Field Types of Database:%s do not match that of this database!";
inline constexpr const char* kDeleteLinkedQuestion =
    "Would you like to delete the linked records also? (Y/N)";
inline constexpr const char* kFileFilter =
    "Cardovex Files (*.pdb)|*.pdb|All Files (*.*)|*.*||";
}  // namespace link_messages

}  // namespace cx
