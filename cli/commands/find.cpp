// find FILE TEXT: "Search Database", then "Repeat the current Find" until
// nothing more is found; every hit is printed.
#include <sys/stat.h>
#include <unistd.h>

#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "cli/record_output.h"
#include "ops/find.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

// A file nobody may write was made read-only on purpose; searching it
// must still work, it only cannot keep the search settings.
bool ReadOnlyFile(const std::string& path) {
  struct stat st {};
  if (::stat(path.c_str(), &st) != 0) return false;
  return (st.st_mode & 0222) == 0 || ::access(path.c_str(), W_OK) != 0;
}

// What the search settings keep of the text (the dialog's box takes no
// more); a longer text would be searched for in full once and cut after.
constexpr size_t kSearchTextMax = 34;

class FindCommand : public Command {
 public:
  std::string name() const override { return "find"; }
  std::string summary() const override { return "search the records in view for a text"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FILE")
        .Positional("TEXT")
        .About("Stores the search settings in FILE as the Search Database dialog does and\n"
               "saves it (unless FILE is read-only), searches from the first record, then\n"
               "repeats the find until nothing more is found, and prints every hit in table\n"
               "order.\n")
        .Option("--field", "F",
                "search only field F (slot number 0-29 or name); default \"Search All Fields\"")
        .Flag("--case-sensitive", "letters must match in case (otherwise A-Z match either case)")
        .Flag("--begins-with", "the field's text must begin with TEXT")
        .Flag("--records",
              "print the records hit, as 'records' prints them, instead of one line per hit")
        .Notes("Only the records in view (those that pass the filters) are searched, each\n"
               "field as the list shows it. Integer and Unique fields match only a TEXT of\n"
               "digits; a Check-Box matches \"1\" when checked and \"0\" when not.\n"
               "Each repeat starts at field 0 of the record after the last hit, so a\n"
               "record is reported once, with its first matching field. A search never\n"
               "starts at the last record: when the previous hit was the record before\n"
               "it, the last record is not searched.\n"
               "Output: one \"INDEX<TAB>SLOT<TAB>FIELD NAME\" line per hit; with --json\n"
               "[{\"index\": N, \"slot\": S}, ...]. The search ends with \"Not Found in\n"
               "Database!\" on stderr. Exit status 0 when there was a hit, 1 when none.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    SearchSettings search;
    std::string error;
    if (!ToStoredText(args.positional()[1], "TEXT", search.text, error)) {
      return UsageError(ctx, *this, error);
    }
    if (search.text.empty()) return UsageError(ctx, *this, "TEXT is empty");
    if (search.text.size() > kSearchTextMax) {
      return UsageError(ctx, *this, "TEXT has more than " + std::to_string(kSearchTextMax) + " characters");
    }
    search.caseSensitive = args.has("--case-sensitive");
    search.beginsWith = args.has("--begins-with");

    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForCommand(ctx, args.positional()[0], session)) return kExitFailed;
    if (auto f = args.value("--field")) {
      search.field = ResolveField(db, *f);
      if (search.field < 0) return UsageError(ctx, *this, "no field " + *f);
    }

    std::vector<FindHit> hits;
    // Every repeat moves on by at least one record, so the bound is never
    // reached; it only guards against a search that would not move on.
    const size_t bound = db.recordCount() * format::kFieldCount + 1;
    for (int found = SearchDatabase(session, search); found >= 0 && hits.size() < bound;
         found = RepeatFind(session)) {
      hits.push_back(session.found);
    }
    if (!ReadOnlyFile(db.path()) && !SaveForCommand(ctx, db)) return kExitFailed;
    if (args.has("--records")) {
      std::vector<size_t> rows;
      for (const FindHit& h : hits) rows.push_back(static_cast<size_t>(h.index));
      WriteRecords(ctx, db, rows);
    } else {
      Print(ctx, db, hits);
    }
    return hits.empty() ? kExitFailed : kExitOk;
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
