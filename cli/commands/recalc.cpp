// recalc FILE: recompute every calculated field and save.
#include <ostream>

#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "ops/calc.h"

namespace cx::cli {
namespace {

class RecalcCommand : public Command {
 public:
  std::string name() const override { return "recalc"; }
  std::string summary() const override { return "recompute the calculated fields and save"; }
  void Declare(Syntax& syntax) const override {
    syntax.Positional("FILE").About(
        "Runs one full recalculation pass from record 0, in table order, over the\n"
        "records in view (every record when both filters are off), then saves FILE.\n"
        "When a sort key is a Calculated field the records are sorted again\n"
        "afterwards and the fields that use the previous record are recomputed in\n"
        "the new order. Results use the decimal separator of the global options.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForCommand(ctx, args.positional()[0], session)) return kExitFailed;
    if (RecalculateFrom(session, 0) != 0) return Failure(ctx, "The recalculation stopped early.");
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    ctx.out << "calculated fields recomputed\n";
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(RecalcCommand);

}  // namespace
}  // namespace cx::cli
