// sort FILE KEY [KEY [KEY]]: the Sorting dialog's OK from the command line.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "ops/open_database.h"
#include "ops/sort.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class SortCommand : public Command {
 public:
  std::string name() const override { return "sort"; }
  std::string summary() const override { return "set up to three sort keys, sort and save"; }
  std::string help() const override {
    return "Usage: cardovex-cli sort FILE KEY [KEY [KEY]]\n"
           "Sets the primary, secondary and tertiary sort keys as the Sorting dialog\n"
           "does, sorts the records, recalculates what depends on their order and\n"
           "saves FILE. KEY is a slot number (0-29) or a field name (case ignored),\n"
           "optionally followed by \":reverse\" (or \":forward\", the default); keys not\n"
           "given are set to \"No Field\".\n"
           "Each key is checked as the dialog checks it: a Not-Used, Image, Link or\n"
           "Heading field, and a Calculated field whose value depends on the previous\n"
           "record, cannot be a sort key; the dialog's message is shown and nothing\n"
           "changes. As in the dialog, the tertiary key always takes the primary key's\n"
           "direction.\n"
           "Records that compare equal on every key may come out in any order.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {}, {});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    const auto& p = args.positional();
    if (p.size() < 2 || p.size() > 4) return UsageError(ctx, *this, "expected FILE and one to three KEYs");
    Database db;
    if (!OpenForCommand(ctx, p[0], db)) return kExitFailed;
    DataSession session(db, ctx.locale, ctx.ui);
    RunPendingWork(session);

    SortingChoice choice;
    for (size_t k = 0; k + 1 < p.size(); ++k) {
      int field = -1;
      bool forward = true;
      std::string error;
      if (!ParseSortKeyText(db.schema(), Utf8ToCp1252(p[k + 1]), field, forward, error)) {
        return UsageError(ctx, *this, Cp1252ToUtf8(error));
      }
      choice.entry[k] = field + 1;
      choice.forward[k] = forward;
    }
    if (!AcceptSortingDialog(db, choice, ctx.ui)) return kExitFailed;
    SortAfterDialog(session);
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    ctx.out << db.recordCount() << (db.recordCount() == 1 ? " record" : " records") << " sorted\n";
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(SortCommand);

}  // namespace
}  // namespace cx::cli
