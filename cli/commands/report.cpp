// report FILE FIELD: the summary report of one field over the records in view.
#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/text_output.h"
#include "cli/database_access.h"
#include "ops/report.h"

namespace cx::cli {
namespace {

class ReportCommand : public Command {
 public:
  std::string name() const override { return "report"; }
  std::string summary() const override { return "count, extremes, sum and average of a field"; }
  std::string help() const override {
    return "Usage: cardovex-cli report FILE FIELD [-o OUT [--force]]\n"
           "Prints the report of FIELD (a slot number 0-29 or a name) over the records\n"
           "in view, exactly as the Report Results dialog shows it: lines ending in\n"
           "CR LF, tabs as they are. Integer, Float, Check-Box, Time, Date and\n"
           "Calculated fields have reports.\n"
           "  -o OUT   write the report to OUT instead (Windows-1252, followed by one\n"
           "           LF), as the dialog's Export does; a FIFO or device is written\n"
           "           into\n"
           "  --force  write OUT even when it is a database or FILE itself\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {"-o"}, {"--force"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 2) return UsageError(ctx, *this, "expected FILE FIELD");
    if (auto out = args.value("-o"); out && !TextTargetAllowed(ctx, args, *out, args.positional()[0])) {
      return kExitFailed;
    }
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    const int slot = ResolveField(db, args.positional()[1]);
    if (slot < 0) return UsageError(ctx, *this, "no field " + args.positional()[1]);
    std::optional<std::string> text = RunReport(db, slot, ctx.locale, ctx.ui);
    if (!text) return kExitFailed;
    if (auto out = args.value("-o")) {
      if (Status s = ExportReportText(*text, *out); !s) return Failure(ctx, s.message());
      return kExitOk;
    }
    Utf8StreamSink(ctx.out).Write(*text);
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ReportCommand);

}  // namespace
}  // namespace cx::cli
