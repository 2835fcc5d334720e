// sort FILE KEY [KEY [KEY]]: the Sorting dialog's OK from the command line.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "ops/calc.h"
#include "ops/sort.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class SortCommand : public Command {
 public:
  std::string name() const override { return "sort"; }
  std::string summary() const override { return "set up to three sort keys, sort and save"; }
  void Declare(Syntax& syntax) const override {
    syntax.Positional("FILE")
        .Positional("KEY", Count{1, 3})
        .About("Sets the primary, secondary and tertiary sort keys as the Sorting dialog\n"
               "does, sorts the records, recalculates what depends on their order and\n"
               "saves FILE. KEY is a slot number (0-29) or a field name (case ignored),\n"
               "optionally followed by \":reverse\" (or \":forward\", the default); keys not\n"
               "given are set to \"No Field\". A KEY that names no field is a usage error.\n"
               "Each key is checked as the dialog checks it: a Not-Used, Image, Link or\n"
               "Heading field, and a Calculated field whose value depends on the previous\n"
               "record, cannot be a sort key; the dialog's message goes to stderr, FILE\n"
               "is left as it was and the exit status is 1. As in the dialog, the tertiary\n"
               "key always takes the primary key's direction.\n"
               "Records that compare equal on every key may come out in any order.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForCommand(ctx, p[0], session)) return kExitFailed;

    // The dialog as it opens, so that a key left out keeps its stored
    // direction byte.
    SortingChoice choice = OpenSortingDialog(db.schema());
    for (size_t k = 0; k < 3; ++k) choice.entry[k] = 0;
    for (size_t k = 0; k + 1 < p.size(); ++k) {
      int field = -1;
      bool forward = true;
      std::string error;
      const std::optional<std::string> key = StoredTextOrNothing(p[k + 1]);
      if (!key) return UsageError(ctx, *this, "no field " + p[k + 1]);
      if (!ParseSortKeyText(db.schema(), *key, field, forward, error)) {
        return UsageError(ctx, *this, Cp1252ToUtf8(error));
      }
      choice.entry[k] = field + 1;
      choice.forward[k] = forward;
    }
    if (!AcceptSortingDialog(db, choice, ctx.ui)) return kExitFailed;
    SortAll(session, false);
    // The recalculation that follows a sort and the save run side by side.
    if (Status saved = RecalculateWhileSaving(session, [&] { RecalculateAfterMove(session, 0, 1); }); !saved) {
      Failure(ctx, saved.message());
      return kExitFailed;
    }
    if (ctx.json) {
      PrintCounts(ctx, {{"sorted", static_cast<int64_t>(db.recordCount())}});
      return kExitOk;
    }
    ctx.out << db.recordCount() << (db.recordCount() == 1 ? " record" : " records") << " sorted\n";
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(SortCommand);

}  // namespace
}  // namespace cx::cli
