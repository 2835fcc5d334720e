// import-csv FILE IN: appends one record per line of a CSV file.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "ops/csv_import.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class ImportCsvCommand : public Command {
 public:
  std::string name() const override { return "import-csv"; }
  std::string summary() const override { return "append the records of a CSV file"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--password PW] import-csv FILE IN [--by-slot] [--strict]\n"
           "Appends one record per line of IN (Windows-1252 text) after the existing\n"
           "records and saves FILE. Column n goes to the nth used field of the display\n"
           "order; there is no header line (a header would become a record).\n"
           "  --by-slot   column n goes to field slot n instead\n"
           "  --strict    refuse the whole file (importing nothing) when any value would\n"
           "              not be stored as given\n"
           "Values convert by the field's type: dates and times through the date and\n"
           "time patterns of the global options (times keep hours and minutes), Pop-Up\n"
           "texts are found in the field's list or appended to it while it holds fewer\n"
           "than 60 entries, an empty Unique column gets the next unique number.\n"
           "A file with more lines than the database has room for is refused.\n"
           "Values that cannot be stored as given (text in a number, check-box, date or\n"
           "time column, a value longer than its field, a new Pop-Up text for a full\n"
           "list, a quote never closed) are stored by those rules all the same; stderr\n"
           "tells how many lines held them, and the first ones by line number.\n"
           "Needs the \"Add Records\" access.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {}, {"--by-slot", "--strict"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 2) return UsageError(ctx, *this, "expected FILE IN");
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    if (!PassAccessCheck(ctx, db, secured::kAddRecords)) return kExitFailed;
    const int mode = args.has("--by-slot") ? kCsvColumnsBySlot : kCsvColumnsByDisplayOrder;
    CsvImportResult result = ImportCsvFile(db, args.positional()[1], mode, CsvSettings(),
                                           ctx.locale, args.has("--strict"));
    if (!result.issues.empty()) ReportIssues(ctx, db, result.issues);
    if (!result.status) return Failure(ctx, result.status.message());
    if (db.changed() && !SaveForCommand(ctx, db)) return kExitFailed;
    ctx.out << result.imported << (result.imported == 1 ? " record" : " records") << " imported\n";
    return kExitOk;
  }

 private:
  static void ReportIssues(Context& ctx, const Database& db, const CsvImportIssues& issues);
};

void ImportCsvCommand::ReportIssues(Context& ctx, const Database& db, const CsvImportIssues& issues) {
  ctx.err << "import-csv: " << issues.lines << (issues.lines == 1 ? " line holds" : " lines hold")
          << " values that are not stored as given";
  ctx.err << (issues.lines > CsvImportIssues::kKeptLines ? "; the first of them:\n" : ":\n");
  for (const std::string& line : issues.Describe(db.schema())) {
    ctx.err << "  " << Cp1252ToUtf8(line) << "\n";
  }
}

CX_REGISTER_COMMAND(ImportCsvCommand);

}  // namespace
}  // namespace cx::cli
