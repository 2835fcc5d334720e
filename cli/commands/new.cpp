// new FILE: a new database with the fields given.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/field_spec.h"
#include "cli/json_output.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class NewCommand : public Command {
 public:
  std::string name() const override { return "new"; }
  std::string summary() const override { return "create a new database with the fields given"; }
  void Declare(Syntax& syntax) const override {
    syntax.Positional("FILE")
        .About("Creates a database whose fields take slots 0, 1, ... in the order given.\n")
        .Option("--name", "NAME", "the database name (at most 19 characters)", Take::kRequired)
        .Option("--field", "DEF",
                "NAME:TYPE[:option=value,...]; TYPE is a type label: Text, Integer, Float, "
                "Pop-Up, Check-Box, Unique, Image, Date, Time, Link, Linked, Note, Heading, "
                "DB Popup, Calculated",
                Take::kRepeatable)
        .Flag("--extension", "records carry the 20-byte prefix extension")
        .Flag("--force", "replace FILE if it exists")
        .Notes(kFieldSpecHelp);
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    const std::string path = args.positional()[0];
    std::string name, error;
    if (!ToStoredText(args.value("--name").value_or(""), "--name", name, error)) {
      return UsageError(ctx, *this, error);
    }
    if (name.empty()) return UsageError(ctx, *this, "--name is required");
    if (name.size() > 19) return UsageError(ctx, *this, "a database name has at most 19 characters");
    if (args.values("--field").size() > format::kFieldCount) {
      return UsageError(ctx, *this, "a database has at most 30 fields");
    }
    if (FileExists(path) && !args.has("--force")) {
      return Failure(ctx, "ERROR: " + path + " exists (use --force to replace it)");
    }

    Database db = Database::CreateNew(path, name);
    Schema& schema = db.schema();
    if (args.has("--extension")) schema.recordExtension = 1;
    std::vector<FieldSpec> plans;
    for (const std::string& text : args.values("--field")) {
      FieldSpec plan;
      std::string error;
      if (!ParseFieldSpec(text, plan, error)) return UsageError(ctx, *this, error);
      plans.push_back(std::move(plan));
    }
    for (size_t slot = 0; slot < plans.size(); ++slot) schema.field[slot] = plans[slot].def;
    for (size_t slot = 0; slot < plans.size(); ++slot) {
      std::string error;
      if (!ResolveOperands(plans[slot], schema, error)) return UsageError(ctx, *this, error);
      schema.field[slot] = plans[slot].def;
      db.popups()[slot].items = plans[slot].popupItems;
    }
    return SaveForCommand(ctx, db) ? kExitOk : kExitFailed;
  }
};

CX_REGISTER_COMMAND(NewCommand);

}  // namespace
}  // namespace cx::cli
