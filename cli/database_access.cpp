#include "cli/database_access.h"

#include <algorithm>
#include <ostream>
#include <tuple>

#include "cli/argument_text.h"
#include "design/security.h"
#include "engine/database_folder.h"
#include "ops/open_database.h"
#include "platform/data_folder.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

// Long enough for any other command on a database of the largest size to
// finish; a command that is still waiting then is stuck behind something
// else, and the user hears about it.
constexpr int kLockWaitMs = 60000;

bool SameFileAs(const FileState& a, const FileState& b) {
  return a.device == b.device && a.inode == b.inode;
}

}  // namespace

std::string LocateDatabase(const std::string& path) {
  if (path.empty() || path == "-" || path.find('/') != std::string::npos || StatFile(path)) return path;
  const std::string folder = DataFolder();
  for (const std::string& name : {path, path + ".PDB"}) {
    const std::string candidate = DatabasePath(folder, name);
    if (StatFile(candidate)) return candidate;
  }
  return path;
}

bool LockDatabases(Context& ctx, const std::vector<std::string>& paths, FileLock::Kind kind) {
  std::vector<std::pair<FileState, std::string>> wanted;
  for (const std::string& path : paths) {
    std::optional<FileState> state = StatFile(path);
    if (!state) continue;
    bool known = false;
    for (const auto& held : ctx.locks) known = known || SameFileAs(held->state(), *state);
    for (const auto& w : wanted) known = known || SameFileAs(w.first, *state);
    if (!known) wanted.emplace_back(*state, path);
  }
  // One order for everyone, so that two commands that both lock the same
  // two files never each hold one while waiting for the other.
  std::sort(wanted.begin(), wanted.end(), [](const auto& a, const auto& b) {
    return std::tie(a.first.device, a.first.inode) < std::tie(b.first.device, b.first.inode);
  });
  for (const auto& w : wanted) {
    auto lock = std::make_unique<FileLock>();
    if (Status s = lock->Acquire(w.second, kLockWaitMs, kind); !s) {
      Failure(ctx, s.message());
      return false;
    }
    if (lock->held()) ctx.locks.push_back(std::move(lock));
  }
  return true;
}

bool OpenForCommand(Context& ctx, const std::string& path, Database& db) {
  DataSession session(db, ctx.locale, ctx.ui);
  return OpenForCommand(ctx, path, session);
}

namespace {

bool OpenLocked(Context& ctx, const std::string& given, DataSession& session, FileLock::Kind kind) {
  const std::string path = LocateDatabase(given);
  if (!LockDatabases(ctx, {path}, kind)) return false;
  // The command ends within moments and holds the file's lock meanwhile, so
  // the file's own cached pages can serve as its image; main() turns the
  // fault of a file cut short by another program into an error. Its
  // protection is checked on the schema before any record is read.
  return OpenDatabase(session, path, FileBuffer::Access::kMap,
                      [&ctx](const Schema& schema) { return CheckOpenAccess(schema, ctx.ui); })
      .ok();
}

}  // namespace

bool OpenForCommand(Context& ctx, const std::string& given, DataSession& session) {
  return OpenLocked(ctx, given, session, FileLock::Kind::kExclusive);
}

bool OpenForReading(Context& ctx, const std::string& path, Database& db) {
  DataSession session(db, ctx.locale, ctx.ui);
  return OpenForReading(ctx, path, session);
}

bool OpenForReading(Context& ctx, const std::string& given, DataSession& session) {
  return OpenLocked(ctx, given, session, FileLock::Kind::kShared);
}

bool OpenHeadForCommand(Context& ctx, const std::string& given, DatabaseHead& head) {
  const std::string path = LocateDatabase(given);
  if (Status read = ReadDatabaseHead(path, head); !read) {
    ctx.ui.ShowMessage(read.message(), "Error", MessageIcon::Error);
    return false;
  }
  return CheckOpenAccess(head.schema, ctx.ui);
}

bool SaveForCommand(Context& ctx, Database& db, const std::string& path) {
  Status s = path.empty() ? db.Save() : db.SaveAs(path);
  if (!s) {
    Failure(ctx, s.message());
    return false;
  }
  return true;
}

bool RecordOption(const Arguments& args, const Database& db, std::optional<size_t>& record,
                  std::string& error) {
  auto text = args.value("--record");
  if (!text) return true;
  auto n = ParseNumber(*text);
  if (!n || *n < 0 || static_cast<size_t>(*n) >= db.recordCount()) {
    error = "--record takes a record index below " + std::to_string(db.recordCount());
    return false;
  }
  record = static_cast<size_t>(*n);
  return true;
}

int ResolveField(const Database& db, const std::string& text) {
  if (auto n = ParseNumber(text); n && *n >= 0 && *n < format::kFieldCount) return static_cast<int>(*n);
  std::optional<std::string> wanted = StoredTextOrNothing(text);
  if (!wanted) return -1;
  for (int slot = 0; slot < format::kFieldCount; ++slot) {
    if (db.schema().field[slot].name.str() == *wanted) return slot;
  }
  return -1;
}

}  // namespace cx::cli
