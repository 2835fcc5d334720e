// records FILE: the value text of every field of the records in view (or
// of all records, one record, or the result of a query), in table order.
#include <ostream>

#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/query.h"
#include "cli/record_output.h"
#include "ops/session.h"

namespace cx::cli {
namespace {

class RecordsCommand : public Command {
 public:
  std::string name() const override { return "records"; }
  std::string summary() const override { return "list the records with every value as shown"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FILE")
        .Form({"FILE", "--all|--record"})
        .Form({"FILE", "--where", "--sort"})
        .About("Lists the records in view (those that pass the database's filters) in\n"
               "table order, each field in display order, values as the list shows them\n"
               "with the date, time and decimal conventions of the global options.\n")
        .Flag("--all", "every record, whatever the filters say")
        .Option("--record", "INDEX", "the one record INDEX")
        .Option("--where", "COND",
                "only the records that meet COND, written as 'filter' takes it (FIELD=VALUE); "
                "every COND given must hold, and the database's own filters play no part",
                Take::kRepeatable)
        .Option("--sort", "KEY",
                "up to three keys, written as 'sort' takes them, the first given first; records "
                "equal on every key stay in table order",
                Take::kRepeatable)
        .Notes("A query changes nothing: FILE is not written, so it also works on a file\n"
               "that may only be read. The index printed is always the record's place in\n"
               "FILE, the INDEX that 'edit' and 'delete --record' take.\n"
               "With --json: an array of {\"index\": N, \"fields\": [{\"slot\", \"name\",\n"
               "\"text\", \"value\"}]}, line breaks kept; \"value\" is typed and the same\n"
               "under any conventions (numbers, true/false, \"YYYY-MM-DD\", \"HH:MM:SS\",\n"
               "null for no value). Without: a tab-separated table with a header row,\n"
               "the index first, line breaks shown as blanks.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const bool query = args.has("--where") || args.has("--sort");
    if (args.has("--all") + args.has("--record") + query > 1) {
      return UsageError(ctx, *this, "--all, --record and a query go alone");
    }
    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForReading(ctx, args.positional()[0], session)) return kExitFailed;

    std::vector<size_t> rows;
    std::optional<size_t> record;
    std::string error;
    if (!RecordOption(args, db, record, error)) return UsageError(ctx, *this, error);
    if (record) {
      rows.push_back(*record);
    } else if (query) {
      if (!QueryRows(ctx, db, args.values("--where"), args.values("--sort"), rows, error)) {
        return error.empty() ? kExitFailed : UsageError(ctx, *this, error);
      }
    } else if (args.has("--all")) {
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
