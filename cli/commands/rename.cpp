// rename FILE NAME: the database's name (the file keeps its file name).
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "design/properties.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class RenameCommand : public HandParsedCommand {
 public:
  std::string name() const override { return "rename"; }
  std::string summary() const override { return "change the database's name (not the file's)"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--password PW] rename FILE NAME\n"
           "Sets the name stored in the database (at most 19 characters); the file\n"
           "keeps its file name. Needs the \"DB Properties\" access.\n";
  }

  int RunRaw(Context& ctx, const std::vector<std::string>& argv) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    Args args(argv, {}, {});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 2) return UsageError(ctx, *this, "expected FILE NAME");
    std::string name, error;
    if (!ToStoredText(args.positional()[1], "NAME", name, error)) return UsageError(ctx, *this, error);
    if (name.size() > kDatabaseNameChars) {
      return UsageError(ctx, *this, "a database name has at most 19 characters");
    }
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    if (!PassAccessCheck(ctx, db, secured::kDBProperties)) return kExitFailed;
    SetDatabaseName(db, name);
    return SaveForCommand(ctx, db) ? kExitOk : kExitFailed;
  }
};

CX_REGISTER_COMMAND(RenameCommand);

}  // namespace
}  // namespace cx::cli
