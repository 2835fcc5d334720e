// report FILE FIELD: the summary report of one field over the records in view.
#include <charconv>
#include <string>
#include <vector>

#include "cli/command.h"
#include "cli/commands/text_output.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "cli/json_output.h"
#include "cli/text_files.h"
#include "ops/report.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class ReportCommand : public Command {
 public:
  std::string name() const override { return "report"; }
  std::string summary() const override { return "count, extremes, sum and average of a field"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FILE")
        .Positional("FIELD")
        .About("Prints the report of FIELD (a slot number 0-29 or a name) over the records\n"
               "in view, exactly as the Report Results dialog shows it: lines ending in\n"
               "CR LF, tabs as they are. Integer, Float, Check-Box, Time, Date and\n"
               "Calculated fields have reports.\n")
        .Option("-o", "OUT",
                "write the report to OUT instead (followed by one LF), as the dialog's Export "
                "does; a FIFO or device is written into; '-' is standard output")
        .Flag("--force", "write OUT even when it is a database or FILE itself");
    DeclareEncoding(syntax);
  }


  int Run(Context& ctx, const Arguments& args) override {
    TextEncoding encoding;
    if (int code; !EncodingOption(ctx, *this, args, encoding, code)) return code;
    const std::string target = args.value("-o").value_or("-");
    if (target != "-") {
      if (int code = RefuseJson(ctx, *this)) return code;
    }
    if (target != "-" && !TextTargetAllowed(ctx, args, target, args.positional()[0])) {
      return kExitFailed;
    }
    Database db;
    if (!OpenForReading(ctx, args.positional()[0], db)) return kExitFailed;
    const int slot = ResolveField(db, args.positional()[1]);
    if (slot < 0) return UsageError(ctx, *this, "no field " + args.positional()[1]);
    LocaleInfo locale = ctx.locale;
    // Scripts read numbers with a decimal point whatever the settings.
    if (ctx.json) locale.decimalSeparator = '.';
    std::optional<std::string> text = RunReport(db, slot, locale, ctx.ui);
    if (!text) return kExitFailed;
    if (ctx.json) {
      PrintReport(ctx, db, slot, *text);
      return kExitOk;
    }
    // The file gets the dialog's Export bytes, the terminal the text alone.
    Status written = WriteTextTo(ctx, target, encoding, [&](TextSink& sink) {
      sink.Write(*text);
      if (target != "-") sink.Write("\n");
    });
    if (!written) return Failure(ctx, written.message());
    return kExitOk;
  }

 private:
  // {"slot", "name", "title", "entries": {"numberOfEntries": 2, ...}}: each
  // "Label:<TAB>value" line of the report under its label's key, numbers as
  // numbers.
  static void PrintReport(Context& ctx, const Database& db, int slot, const std::string& report) {
    std::vector<std::string> lines;
    for (size_t start = 0; start < report.size();) {
      size_t end = report.find("\r\n", start);
      if (end == std::string::npos) end = report.size();
      lines.push_back(report.substr(start, end - start));
      start = end + 2;
    }
    JsonWriter j(ctx.out);
    j.BeginObject();
    j.Key("slot").Number(slot);
    j.Key("name").String(Cp1252ToUtf8(db.schema().field[slot].name.str()));
    j.Key("title").String(lines.empty() ? "" : Cp1252ToUtf8(lines[0]));
    j.Key("entries").BeginObject();
    for (size_t i = 1; i < lines.size(); ++i) {
      const size_t colon = lines[i].find(':');
      if (colon == std::string::npos) continue;
      std::string value = lines[i].substr(colon + 1);
      value.erase(0, value.find_first_not_of('\t'));
      j.Key(CamelCaseKey(lines[i].substr(0, colon)));
      double number = 0;
      auto [ptr, ec] = std::from_chars(value.data(), value.data() + value.size(), number);
      if (!value.empty() && ec == std::errc() && ptr == value.data() + value.size()) {
        j.Double(number);
      } else {
        j.String(Cp1252ToUtf8(value));
      }
    }
    j.EndObject();
    j.EndObject();
    j.Finish();
  }
};

CX_REGISTER_COMMAND(ReportCommand);

}  // namespace
}  // namespace cx::cli
