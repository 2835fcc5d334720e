// Access levels and the database password: each database guards eight
// operations with a level of its own, and one check routine is asked at
// every place where a guarded operation begins.
#pragma once

#include <array>
#include <string>
#include <string_view>

#include "engine/record_store.h"
#include "engine/schema.h"
#include "platform/ui_port.h"

namespace cx {

// Guarded operations, numbered as stored (two bits each in the level word).
namespace secured {
inline constexpr int kOpenDatabase = 0;
inline constexpr int kAddRecords = 1;
inline constexpr int kEditRecords = 2;
inline constexpr int kDeleteRecords = 3;
inline constexpr int kDBProperties = 4;
inline constexpr int kDeleteDatabase = 5;  // kept and saved, never asked for
inline constexpr int kEditPopups = 6;
inline constexpr int kBeamData = 7;
inline constexpr int kCount = 8;
}  // namespace secured

// Access levels: the position in the dialog's list.
namespace access_level {
inline constexpr int kFull = 0;
inline constexpr int kPassword = 1;
inline constexpr int kNone = 2;
inline constexpr int kViewOnly = 3;
inline constexpr int kCount = 4;
}  // namespace access_level

// "Open Database", "Add Records", ... for operation 0 to 7 ("" otherwise).
std::string_view OperationLabel(int op);
// "Full Access", "Password Required", "No Access", "View Records Only".
std::string_view AccessLevelLabel(int level);
// How many levels the dialog offers for an operation: four for "Edit
// Records" (which alone offers "View Records Only"), three for the others.
int LevelsOffered(int op);
// Case-insensitive lookups for scripts: the labels above, or their words
// run together and lower-cased ("editrecords", "viewonly" also accepted for
// levels: "full", "password", "none"). -1 when unknown.
int OperationFromName(std::string_view name);
int AccessLevelFromName(std::string_view name);

// The level of an operation: bits 2*op and 2*op+1 of the level word. An
// operation whose bits would lie at or beyond bit 32 reads as 0.
int ReadLevel(const Schema& schema, int op);
// Clears the operation's two bits and writes `level` into them; operations
// outside the word are not written.
void SetLevel(Schema& schema, int op, int level);

// The password prompt for a database whose password is `expected`: the
// typed text must equal it exactly (letter case counts); a wrong one shows
// "Invalid Password" / "ERROR" and prompts again until the user cancels.
// True when the right password was given.
bool AskForPassword(UiPort& ui, const std::string& expected);

enum class Access { Refused = 0, Granted = 1, ViewOnly = 2 };

// Callers other than the record editor treat view only as granted.
inline bool Allowed(Access a) { return a != Access::Refused; }

// The access check. Full access grants, "View Records Only" answers view
// only, "Password Required" asks for the database's password (nothing is
// remembered: every call asks again), anything else refuses; a refusal (or
// a cancelled password prompt) shows "Sorry, You do Not have Security
// Access to Perform this Operation!" / "ACCESS DENIED" when showMessage.
Access CheckAccess(const Schema& schema, int op, UiPort& ui, bool showMessage = true);
Access CheckAccess(const Database& db, int op, UiPort& ui, bool showMessage = true);

// The open level of a database: 0 "Full Access", 1 "Password Required",
// -1 for any other level of "Open Database".
int OpenLevel(const Schema& schema);
// The same, read from a database file that is not loaded (its schema
// record alone). -2 when the file's schema cannot be read; `schema` (when
// given) receives the schema read.
int OpenLevel(const std::string& path, Schema* schema = nullptr);

// The check made before a database file is opened: -1 refuses with "Action
// Not Allowed for this Database!" / "ACCESS DENIED"; 1 asks for the file's
// stored password (a cancel abandons the open quietly); 0 allows. A file
// whose schema cannot be read (by the open's own reader) is refused with
// the message the open would show.
bool CheckOpenAccess(const std::string& path, UiPort& ui);
// The same rule on a schema already read (a linked database that is loaded).
bool CheckOpenAccess(const Schema& schema, UiPort& ui);

// What the Security Access dialog edits.
struct SecuritySettings {
  std::string password;                          // at most 19 characters kept
  std::array<int, secured::kCount> levels{};     // per operation, 0 to 3
};

SecuritySettings LoadSecuritySettings(const Schema& schema);
// OK of the dialog: the password (cut to 19 characters), then the eight
// levels in operation order, and the database is marked changed. The
// hidden "Delete Database" row is written back as it was loaded.
void ApplySecuritySettings(Database& db, const SecuritySettings& settings);

namespace security_messages {
inline constexpr const char* kDenied =
    "Sorry, You do Not have Security Access to Perform this Operation!";
inline constexpr const char* kOpenDenied = "Action Not Allowed for this Database!";
inline constexpr const char* kDeniedCaption = "ACCESS DENIED";
inline constexpr const char* kInvalidPassword = "Invalid Password";
}  // namespace security_messages

}  // namespace cx
