// print FILE: the listing handed to the print command.
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "design/link_access.h"
#include "ops/linked_listing.h"
#include "ops/print.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"

namespace cx::cli {
namespace {

class PrintCommand : public Command {
 public:
  std::string name() const override { return "print"; }
  std::string summary() const override { return "print records through the print command"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .About("Writes the listing of the records in view (or of record N) to\n"
               "cxprnttemp.txt in the documents folder, runs the print command on it\n"
               "and removes the file again.\n")
        .Option("--record", "N", "record N alone (its index in table order)")
        .Option("--command", "CMD", "the print command (default: lp FILE)")
        .Option("--arg", "ARG", "an argument for the print command, before the file",
                Take::kRepeatable)
        .Notes("Exit code 0 of the command reports \"Data Printed OK\", 63 means cancelled\n"
               "(no message), others report a problem. Nothing is run when the listing is\n"
               "empty.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    Database db;
    if (!OpenForReading(ctx, args.positional()[0], db)) return kExitFailed;
    std::optional<size_t> record;
    if (std::string error; !RecordOption(args, db, record, error)) return UsageError(ctx, *this, error);
    const bool all = !record;
    const size_t current = record.value_or(0);
    PrintSettings settings;
    if (auto c = args.value("--command")) settings.command = *c;
    settings.arguments = args.values("--arg");
    settings.tempPath = DefaultPrintTempPath();
    MakeDirectories(FolderPart(settings.tempPath));
    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    LinkedRecordsListing linked(services, ctx.locale);
    SystemProcessRunner runner;
    PrintOutcome outcome =
        PrintRecords(db, all, current, ListingContext{ctx.locale, &linked}, settings, runner, ctx.ui);
    switch (outcome) {
      case PrintOutcome::Printed:
      case PrintOutcome::Cancelled:
      case PrintOutcome::NothingToPrint:
        return kExitOk;
      default:
        return kExitFailed;
    }
  }
};

CX_REGISTER_COMMAND(PrintCommand);

}  // namespace
}  // namespace cx::cli
