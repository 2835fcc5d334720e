#include "cli/database_access.h"

#include <ostream>

#include "cli/args.h"
#include "design/security.h"
#include "ops/open_database.h"
#include "platform/text_codec.h"

namespace cx::cli {

bool OpenForCommand(Context& ctx, const std::string& path, Database& db) {
  DataSession session(db, ctx.locale, ctx.ui);
  return OpenForCommand(ctx, path, session);
}

bool OpenForCommand(Context& ctx, const std::string& path, DataSession& session) {
  if (!CheckOpenAccess(path, ctx.ui)) return false;
  return OpenDatabase(session, path).ok();
}

bool OpenHeadForCommand(Context& ctx, const std::string& path, DatabaseHead& head) {
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

bool RecordOption(const Args& args, const Database& db, std::optional<size_t>& record,
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
