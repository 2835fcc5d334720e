// resave FILE [OUT]: open and save unchanged (round trips, repairs of the
// layout, copies).
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json_output.h"

namespace cx::cli {
namespace {

class ResaveCommand : public Command {
 public:
  std::string name() const override { return "resave"; }
  std::string summary() const override { return "open a database and save it again (to OUT if given)"; }
  void Declare(Syntax& syntax) const override {
    syntax.Positional("FILE")
        .Positional("OUT", kOptional)
        .About("Opens FILE and saves it, unchanged, to FILE or to OUT. The file being\n"
               "replaced is never damaged: the new one is written beside it, flushed and\n"
               "renamed over it.\n");
  }

  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    std::string out = args.positional().size() == 2 ? args.positional()[1] : "";
    return SaveForCommand(ctx, db, out) ? kExitOk : kExitFailed;
  }
};

CX_REGISTER_COMMAND(ResaveCommand);

}  // namespace
}  // namespace cx::cli
