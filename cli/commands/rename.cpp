// rename FILE NAME: the database's name (the file keeps its file name).
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "design/properties.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class RenameCommand : public Command {
 public:
  std::string name() const override { return "rename"; }
  std::string summary() const override { return "change the database's name (not the file's)"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .Positional("NAME")
        .About("Sets the name stored in the database (at most 19 characters); the file\n"
               "keeps its file name. Needs the \"DB Properties\" access.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
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
