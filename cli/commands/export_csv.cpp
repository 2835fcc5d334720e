// export-csv FILE OUT: the records as comma-separated text.
#include "cli/command.h"
#include "cli/commands/text_output.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "cli/text_files.h"
#include "ops/csv_export.h"

namespace cx::cli {
namespace {

class ExportCsvCommand : public Command {
 public:
  std::string name() const override { return "export-csv"; }
  std::string summary() const override { return "write the records as comma-separated text"; }
  void Declare(Syntax& syntax) const override {
    syntax.Positional("FILE")
        .Positional("OUT")
        .About("Writes one line per record, each value as the list shows it (\"No Value\"\n"
               "where that is empty; Image columns stay empty), lines ending in LF, in\n"
               "UTF-8. OUT '-' writes to standard output.\n")
        .Flag("--quote-all", "quote every value (and the header's names)")
        .Flag("--header", "a first line of field names")
        .Flag("--filtered", "only the records in view (those that pass the filters)")
        .Flag("--slot-order", "columns in field slot order instead of display order");
    DeclareEncoding(syntax);
    syntax.Flag("--force", "write OUT even when it is a database or FILE itself")
        .Notes("OUT is replaced only once the whole text is written; a FIFO or a device\n"
               "named as OUT is written into.\n"
               "Columns are the used fields. When the first field of the order is\n"
               "Not-Used, every data line starts with a separator that the header lacks.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    TextEncoding encoding;
    if (int code; !EncodingOption(ctx, *this, args, encoding, code)) return code;
    const std::string& out = args.positional()[1];
    if (out != "-" && !TextTargetAllowed(ctx, args, out, args.positional()[0])) return kExitFailed;
    Database db;
    if (!OpenForReading(ctx, args.positional()[0], db)) return kExitFailed;
    CsvExportOptions options;
    options.quoteAll = args.has("--quote-all");
    options.withHeader = args.has("--header");
    options.filteredOnly = args.has("--filtered");
    options.fieldNumberOrder = args.has("--slot-order");
    CsvSettings settings;
    settings.alwaysQuote = options.quoteAll;
    int result = 0;
    Status written = WriteTextTo(ctx, out, encoding, [&](TextSink& sink) {
      result = ExportCsvTo(db, options, sink, settings, ctx.locale, ctx.ui);
    });
    if (!written) return Failure(ctx, written.message());
    if (result != 1) return Failure(ctx, "Could not export every record to " + out);
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ExportCsvCommand);

}  // namespace
}  // namespace cx::cli
