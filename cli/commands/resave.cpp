// resave FILE [OUT]: open and save unchanged (round trips, repairs of the
// layout, copies).
#include "cli/args.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json_output.h"

namespace cx::cli {
namespace {

class ResaveCommand : public HandParsedCommand {
 public:
  std::string name() const override { return "resave"; }
  std::string summary() const override { return "open a database and save it again (to OUT if given)"; }
  std::string help() const override {
    return "Usage: cardovex-cli resave FILE [OUT]\n"
           "Opens FILE and saves it, unchanged, to FILE or to OUT. The file being\n"
           "replaced is never damaged: the new one is written beside it, flushed and\n"
           "renamed over it.\n";
  }
  int RunRaw(Context& ctx, const std::vector<std::string>& argv) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    Args args(argv, {}, {});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().empty() || args.positional().size() > 2) {
      return UsageError(ctx, *this, "expected FILE [OUT]");
    }
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    std::string out = args.positional().size() == 2 ? args.positional()[1] : "";
    return SaveForCommand(ctx, db, out) ? kExitOk : kExitFailed;
  }
};

CX_REGISTER_COMMAND(ResaveCommand);

}  // namespace
}  // namespace cx::cli
