// Opening and saving databases for commands: the access check, the open
// with its messages, the pending work a file asks for, and the save.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "engine/record_store.h"
#include "ops/session.h"

namespace cx::cli {

// FILE as a command names it: a name without a folder that is not a file
// where the command runs is looked for in the data folder, as given and
// then with ".PDB" added. Anything else is returned unchanged.
std::string LocateDatabase(const std::string& path);

// Locks the databases at `paths` for the rest of the command, waiting a
// while for another command that holds one. False after printing the
// message when one stays busy. Files that do not exist are not locked.
// Commands that only read take shared locks, so that two exports of one
// file run side by side, while a command that changes it waits for them.
bool LockDatabases(Context& ctx, const std::vector<std::string>& paths,
                   FileLock::Kind kind = FileLock::Kind::kExclusive);

// Opens `path` into `db` as the program does (after locking it): the "Open Database" access
// check (asking for --password where the file requires it), the open with
// its messages, and the recalculation or re-sort the file still owes. On
// failure the message has gone to stderr and the result is false.
bool OpenForCommand(Context& ctx, const std::string& path, Database& db);
// The same into a session made with ctx's locale and port, for commands
// that go on working in it (its view list and run-time state are kept).
bool OpenForCommand(Context& ctx, const std::string& path, DataSession& session);

// The same for commands that never save the file: it is shared with other
// readers. The open's own follow-up work (a re-sort the file still owes)
// then stays in memory.
bool OpenForReading(Context& ctx, const std::string& path, Database& db);
bool OpenForReading(Context& ctx, const std::string& path, DataSession& session);

// For commands that only show what a file holds before its records: the
// same access check, then the header, schema and popup lists alone, so
// that the cost does not grow with the records.
bool OpenHeadForCommand(Context& ctx, const std::string& path, DatabaseHead& head);

// Saves `db` (to `path` when given); false after printing the message.
bool SaveForCommand(Context& ctx, Database& db, const std::string& path = "");

// "--record N": `record` stays empty without the option and is N when N
// names a record of `db`; false (with `error` set) for anything else.
bool RecordOption(const Arguments& args, const Database& db, std::optional<size_t>& record,
                  std::string& error);

// A field given as a slot number (0-29) or a field name; -1 when neither.
int ResolveField(const Database& db, const std::string& text);

}  // namespace cx::cli
