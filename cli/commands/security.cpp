// security FILE [OPERATION LEVEL ...] [--set-password TEXT]: the Security
// Access settings.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "cli/json_output.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class SecurityCommand : public Command {
 public:
  std::string name() const override { return "security"; }
  std::string summary() const override { return "show or set the access levels and the password"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .Positional("OPERATION LEVEL", kAnyNumber)
        .Form({"FILE", "[OPERATION LEVEL ...]", "--set-password"})
        .About("Without changes, shows the level of each guarded operation (with --json as\n"
               "an object). OPERATION is one of \"Open Database\", \"Add Records\", \"Edit\n"
               "Records\", \"Delete Records\", \"DB Properties\", \"Edit Popups\", \"Beam Data\"\n"
               "(case, blanks and hyphens ignored: edit-records). LEVEL is \"Full Access\",\n"
               "\"Password Required\", \"No Access\" or, for Edit Records only, \"View Records\n"
               "Only\" (also full, password, none, view-only).\n")
        .Option("--set-password", "TEXT",
                "the database password (at most 19 characters; \"\" for none); compared exactly, "
                "case included")
        .Notes("Changes need the \"DB Properties\" access (the current password when it is\n"
               "\"Password Required\", given with --password).\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    if (p.empty() || p.size() % 2 == 0) return UsageError(ctx, *this, "expected FILE [OPERATION LEVEL ...]");
    if (p.size() == 1 && !args.has("--set-password")) {
      DatabaseHead head;
      if (!OpenHeadForCommand(ctx, p[0], head)) return kExitFailed;
      Show(ctx, LoadSecuritySettings(head.schema));
      return kExitOk;
    }
    Database db;
    if (!OpenForCommand(ctx, p[0], db)) return kExitFailed;

    SecuritySettings settings = LoadSecuritySettings(db.schema());
    for (size_t i = 1; i + 1 < p.size(); i += 2) {
      const int op = OperationFromName(p[i]);
      if (op < 0) return UsageError(ctx, *this, "unknown operation " + p[i]);
      if (op == secured::kDeleteDatabase) {
        return UsageError(ctx, *this, "the \"Delete Database\" level is not offered");
      }
      const int level = AccessLevelFromName(p[i + 1]);
      if (level < 0 || level >= LevelsOffered(op)) {
        return UsageError(ctx, *this, "level " + p[i + 1] + " is not offered for " +
                                          std::string(OperationLabel(op)));
      }
      settings.levels[op] = level;
    }
    if (auto pw = args.value("--set-password")) {
      std::string error;
      if (!ToStoredText(*pw, "--set-password", settings.password, error)) {
        return UsageError(ctx, *this, error);
      }
      if (settings.password.size() > 19) {
        return UsageError(ctx, *this, "a password has at most 19 characters");
      }
    }
    if (!PassAccessCheck(ctx, db, secured::kDBProperties)) return kExitFailed;
    ApplySecuritySettings(db, settings);
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    Show(ctx, settings);
    return kExitOk;
  }

 private:
  static void Show(Context& ctx, const SecuritySettings& s) {
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginObject();
      for (int op = 0; op < secured::kCount; ++op) {
        j.Key(CamelCaseKey(OperationLabel(op))).String(std::string(AccessLevelLabel(s.levels[op])));
      }
      j.Key("passwordSet").Bool(!s.password.empty());
      j.EndObject();
      j.Finish();
      return;
    }
    for (int op = 0; op < secured::kCount; ++op) {
      if (op == secured::kDeleteDatabase) continue;  // kept, but never asked for
      ctx.out << OperationLabel(op) << ": " << AccessLevelLabel(s.levels[op]) << "\n";
    }
    ctx.out << "Password: " << (s.password.empty() ? "none" : "set") << "\n";
  }
};

CX_REGISTER_COMMAND(SecurityCommand);

}  // namespace
}  // namespace cx::cli
