// import-csv FILE IN: appends one record per line of a CSV file.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "ops/csv_import.h"

namespace cx::cli {
namespace {

class ImportCsvCommand : public Command {
 public:
  std::string name() const override { return "import-csv"; }
  std::string summary() const override { return "append the records of a CSV file"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--password PW] import-csv FILE IN [--by-slot]\n"
           "Appends one record per line of IN (Windows-1252 text) after the existing\n"
           "records and saves FILE. Column n goes to the nth used field of the display\n"
           "order; there is no header line (a header would become a record).\n"
           "  --by-slot   column n goes to field slot n instead\n"
           "Values convert by the field's type: dates and times through the date and\n"
           "time patterns of the global options (times keep hours and minutes), Pop-Up\n"
           "texts are found in the field's list or appended to it while it holds fewer\n"
           "than 60 entries, an empty Unique column gets the next unique number.\n"
           "A file with more lines than the database has room for is refused.\n"
           "Needs the \"Add Records\" access.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {}, {"--by-slot"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 2) return UsageError(ctx, *this, "expected FILE IN");
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    if (!PassAccessCheck(ctx, db, secured::kAddRecords)) return kExitFailed;
    const int mode = args.has("--by-slot") ? kCsvColumnsBySlot : kCsvColumnsByDisplayOrder;
    CsvImportResult result = ImportCsvFile(db, args.positional()[1], mode, CsvSettings(), ctx.locale);
    if (!result.status) return Failure(ctx, result.status.message());
    if (db.changed() && !SaveForCommand(ctx, db)) return kExitFailed;
    ctx.out << result.imported << (result.imported == 1 ? " record" : " records") << " imported\n";
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ImportCsvCommand);

}  // namespace
}  // namespace cx::cli
