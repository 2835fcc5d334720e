// find FILE TEXT: "Search Database" / "Repeat the current Find" from the
// command line, without changing the file.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "ops/find.h"
#include "ops/open_database.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class FindCommand : public Command {
 public:
  std::string name() const override { return "find"; }
  std::string summary() const override { return "search the records in view for a text"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--json] find FILE TEXT [--field F] [--case] [--begins]\n"
           "                    [--from N] [--all]\n"
           "Searches the records in view (those that pass FILE's filters), in table\n"
           "order from record N (default 0), for TEXT in each field's text as the list\n"
           "shows it, and prints the first hit: record index, field slot, field name.\n"
           "  --field F   search only field F (slot number or name); default all fields\n"
           "  --case      case-sensitive (otherwise letters A-Z match either case)\n"
           "  --begins    the field's text must begin with TEXT\n"
           "  --from N    start at record N; the search never wraps around to record 0\n"
           "  --all       every record with a hit, each once (the first matching field)\n"
           "Integer and Unique fields match only a TEXT of digits; a Check-Box matches\n"
           "\"1\" when checked and \"0\" when not. The file is not changed.\n"
           "Exit status 1 and \"Not Found in Database!\" when nothing matches.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {"--field", "--from"}, {"--case", "--begins", "--all"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 2) return UsageError(ctx, *this, "expected FILE TEXT");
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    DataSession session(db, ctx.locale, ctx.ui);
    RunPendingWork(session);

    SearchSettings search;
    search.text = Utf8ToCp1252(args.positional()[1]);
    search.caseSensitive = args.has("--case");
    search.beginsWith = args.has("--begins");
    if (auto f = args.value("--field")) {
      search.field = ResolveField(db, *f);
      if (search.field < 0) return UsageError(ctx, *this, "no field " + *f);
    }
    int from = 0;
    if (auto n = args.value("--from")) {
      auto v = ParseNumber(*n);
      if (!v || *v < 0) return UsageError(ctx, *this, "--from takes a record index");
      from = static_cast<int>(*v);
    }

    std::vector<FindHit> hits;
    FindHit hit;
    while (FindRecord(db, search, from, 0, &hit, session.Link(), hits.empty() ? &ctx.ui : nullptr,
                      ctx.locale) >= 0) {
      hits.push_back(hit);
      if (!args.has("--all")) break;
      from = hit.index + 1;
    }
    if (hits.empty()) return kExitFailed;
    Print(ctx, db, hits);
    return kExitOk;
  }

 private:
  static void Print(Context& ctx, const Database& db, const std::vector<FindHit>& hits) {
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginArray();
      for (const FindHit& h : hits) {
        j.BeginObject();
        j.Key("index").Number(h.index);
        j.Key("slot").Number(h.field);
        j.Key("name").String(Cp1252ToUtf8(db.schema().field[h.field].name.str()));
        j.Key("column").Number(h.column);
        j.EndObject();
      }
      j.EndArray();
      j.Finish();
      return;
    }
    for (const FindHit& h : hits) {
      ctx.out << h.index << "\t" << h.field << "\t" << Cp1252ToUtf8(db.schema().field[h.field].name.str())
              << "\n";
    }
  }
};

CX_REGISTER_COMMAND(FindCommand);

}  // namespace
}  // namespace cx::cli
