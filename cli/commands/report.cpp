// report FILE FIELD: the summary report of one field over the records in view.
#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/text_output.h"
#include "cli/database_access.h"
#include "cli/text_files.h"
#include "ops/report.h"

namespace cx::cli {
namespace {

class ReportCommand : public Command {
 public:
  std::string name() const override { return "report"; }
  std::string summary() const override { return "count, extremes, sum and average of a field"; }
  std::string help() const override {
    return "Usage: cardovex-cli report FILE FIELD [-o OUT [--force]] [--encoding E]\n"
           "Prints the report of FIELD (a slot number 0-29 or a name) over the records\n"
           "in view, exactly as the Report Results dialog shows it: lines ending in\n"
           "CR LF, tabs as they are. Integer, Float, Check-Box, Time, Date and\n"
           "Calculated fields have reports.\n"
           "  -o OUT   write the report to OUT instead (followed by one LF), as the\n"
           "           dialog's Export does; a FIFO or device is written into; '-'\n"
           "           is standard output\n"
           "  --force  write OUT even when it is a database or FILE itself\n" +
           std::string(kEncodingHelp);
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {"-o", "--encoding"}, {"--force"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    TextEncoding encoding;
    if (int code; !EncodingOption(ctx, *this, args, encoding, code)) return code;
    const std::string target = args.value("-o").value_or("-");
    if (args.positional().size() != 2) return UsageError(ctx, *this, "expected FILE FIELD");
    if (target != "-" && !TextTargetAllowed(ctx, args, target, args.positional()[0])) {
      return kExitFailed;
    }
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    const int slot = ResolveField(db, args.positional()[1]);
    if (slot < 0) return UsageError(ctx, *this, "no field " + args.positional()[1]);
    std::optional<std::string> text = RunReport(db, slot, ctx.locale, ctx.ui);
    if (!text) return kExitFailed;
    // The file gets the dialog's Export bytes, the terminal the text alone.
    Status written = WriteTextTo(ctx, target, encoding, [&](TextSink& sink) {
      sink.Write(*text);
      if (target != "-") sink.Write("\n");
    });
    if (!written) return Failure(ctx, written.message());
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ReportCommand);

}  // namespace
}  // namespace cx::cli
