// import-csv FILE IN: appends one record per line of a CSV file.
#include <ostream>

#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "cli/text_files.h"
#include "ops/csv_import.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class ImportCsvCommand : public Command {
 public:
  std::string name() const override { return "import-csv"; }
  std::string summary() const override { return "append the records of a CSV file"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .Positional("IN")
        .About("Appends one record per line of IN (UTF-8 text, a byte-order mark allowed;\n"
               "'-' reads standard input) after the existing records and saves FILE.\n"
               "Column n goes to the nth used field of the display order.\n")
        .Flag("--header", "the first line names the columns: it is skipped")
        .Flag("--by-slot", "column n goes to field slot n instead")
        .Flag("--strict",
              "refuse the whole file (importing nothing) when any value would not be stored as "
              "given");
    DeclareEncoding(syntax);
    syntax.Notes(
        "A UTF-8 file holding characters that Windows-1252 cannot hold is refused\n"
        "(nothing is imported); stderr names them with their lines.\n"
        "Values convert by the field's type: dates and times through the date and\n"
        "time patterns of the global options (times keep hours and minutes), Pop-Up\n"
        "texts are found in the field's list or appended to it while it holds fewer\n"
        "than 60 entries, an empty Unique column gets the next unique number.\n"
        "A file with more lines than the database has room for is refused.\n"
        "Values that cannot be stored as given (text in a number, check-box, date or\n"
        "time column, a value longer than its field, a new Pop-Up text for a full\n"
        "list, a quote never closed) are stored by those rules all the same; stderr\n"
        "tells how many lines held them, and the first ones by line number.\n"
        "Needs the \"Add Records\" access.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    TextEncoding encoding;
    if (int code; !EncodingOption(ctx, *this, args, encoding, code)) return code;
    const std::string& in = args.positional()[1];
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    if (!PassAccessCheck(ctx, db, secured::kAddRecords)) return kExitFailed;
    const int mode = args.has("--by-slot") ? kCsvColumnsBySlot : kCsvColumnsByDisplayOrder;
    const bool strict = args.has("--strict"), header = args.has("--header");
    CsvImportResult result;
    if (encoding == TextEncoding::kWindows1252 && in != "-") {
      // Read as it comes, without holding the whole file.
      result = ImportCsvFile(db, in, mode, CsvSettings(), ctx.locale, strict, header);
    } else {
      std::string bytes;
      if (Status s = ReadTextFrom(in, bytes); !s) return Failure(ctx, s.message());
      NarrowedText text = NarrowTextInPlace(std::move(bytes), encoding);
      if (!text.lossless()) return RefuseUnstorable(ctx, in, text);
      result = ImportCsvText(db, std::move(text.bytes), TextFileName(in), mode, CsvSettings(),
                             ctx.locale, strict, header);
    }
    if (!result.issues.empty()) ReportIssues(ctx, db, result.issues);
    if (!result.status) return Failure(ctx, result.status.message());
    if (db.changed() && !SaveForCommand(ctx, db)) return kExitFailed;
    if (ctx.json) {
      PrintCounts(ctx, {{"imported", static_cast<int64_t>(result.imported)},
                        {"linesNotStoredAsGiven", static_cast<int64_t>(result.issues.lines)}});
      return kExitOk;
    }
    ctx.out << result.imported << (result.imported == 1 ? " record" : " records") << " imported\n";
    return kExitOk;
  }

 private:
  static void ReportIssues(Context& ctx, const Database& db, const CsvImportIssues& issues);
  static int RefuseUnstorable(Context& ctx, const std::string& in, const NarrowedText& text);
};

int ImportCsvCommand::RefuseUnstorable(Context& ctx, const std::string& in, const NarrowedText& text) {
  ctx.err << "import-csv: " << text.unstorableLines
          << (text.unstorableLines == 1 ? " line holds" : " lines hold")
          << " characters that a database cannot store";
  ctx.err << (text.unstorableLines > NarrowedText::kKeptLines ? "; the first of them:\n" : ":\n");
  for (const std::string& line : DescribeUnstorable(text)) ctx.err << "  " << line << "\n";
  return Failure(ctx, "nothing was imported from " + TextFileName(in) +
                          " (a file written in Windows-1252 needs --encoding windows-1252)");
}

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
