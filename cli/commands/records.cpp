// records FILE: the value text of every field of the records in view (or
// of all records), in table order.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/record_output.h"
#include "ops/session.h"

namespace cx::cli {
namespace {

class RecordsCommand : public Command {
 public:
  std::string name() const override { return "records"; }
  std::string summary() const override { return "list the records with every value as shown"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--json] records FILE [--all]\n"
           "Lists the records in view (those that pass the database's filters) in\n"
           "table order, each field in display order, values as the list shows them\n"
           "with the date, time and decimal conventions of the global options.\n"
           "  --all    every record, whatever the filters say\n"
           "With --json: an array of {\"index\": N, \"fields\": [{\"slot\", \"name\",\n"
           "\"text\", \"value\"}]}, line breaks kept; \"value\" is typed and the same\n"
           "under any conventions (numbers, true/false, \"YYYY-MM-DD\", \"HH:MM:SS\",\n"
           "null for no value). Without: a tab-separated table with a\n"
           "header row, line breaks shown as blanks.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {}, {"--all"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 1) return UsageError(ctx, *this, "expected FILE");
    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForCommand(ctx, args.positional()[0], session)) return kExitFailed;

    std::vector<size_t> rows;
    if (args.has("--all")) {
      rows.resize(db.recordCount());
      for (size_t i = 0; i < rows.size(); ++i) rows[i] = i;
    } else {
      rows.assign(session.view.begin(), session.view.end());
    }
    WriteRecords(ctx, db, rows);
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(RecordsCommand);

}  // namespace
}  // namespace cx::cli
