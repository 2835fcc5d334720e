// copy-records / move-records FILE TARGET [--record N]: records to another
// database of the same design.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "design/link_access.h"
#include "ops/links.h"

namespace cx::cli {
namespace {

class TransferCommand : public Command {
 public:
  explicit TransferCommand(bool move) : move_(move) {}
  std::string name() const override { return move_ ? "move-records" : "copy-records"; }
  std::string summary() const override {
    return move_ ? "move records to another database with the same field types"
                 : "copy records to another database with the same field types";
  }
  void Declare(Syntax& syntax) const override {
    const std::string verb = move_ ? "Moves" : "Copies";
    syntax.Globals({"--password"})
        .Positional("FILE")
        .Positional("TARGET")
        .About(verb +
               " the records in view (those that pass FILE's filters), or record N\n"
               "(its index in table order, as `records` shows it), to the database TARGET,\n"
               "whose 30 field types must equal FILE's slot by slot. The records are added at\n"
               "the end of TARGET, which sorts and recalculates them when it is next opened.\n" +
               (move_ ? "Moving to FILE itself is refused; each record moved leaves FILE only\n"
                        "after passing FILE's \"Delete Records\" access check.\n"
                      : "Copying to FILE itself duplicates the records.\n") +
               "TARGET must pass its \"Open Database\" and \"Add Records\" access checks\n"
               "(one --password serves every prompt).\n" +
               (move_ ? "Nothing leaves FILE unless TARGET was saved first; when TARGET cannot be\n"
                        "saved the command fails and both files stay as they were.\n"
                      : ""))
        .Option("--record", "N", "record N alone");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const std::string target = LocateDatabase(args.positional()[1]);
    if (!LockDatabases(ctx, {LocateDatabase(args.positional()[0]), target})) return kExitFailed;
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    TransferWhich which;
    if (auto r = args.value("--record")) {
      auto n = ParseNumber(*r);
      if (!n || *n < 0 || static_cast<size_t>(*n) >= db.recordCount()) {
        return UsageError(ctx, *this, "--record takes a record index below " +
                                          std::to_string(db.recordCount()));
      }
      which.allInView = false;
      which.index = static_cast<size_t>(*n);
    }
    DataSession session(db, ctx.locale, ctx.ui);
    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    TransferResult result = TransferRecordsTo(move_, which, session, target, services);
    if (!result.done || result.failed) return kExitFailed;
    if (db.changed() && !SaveForCommand(ctx, db)) return kExitFailed;
    if (ctx.json && move_) {
      PrintCounts(ctx, {{"copied", static_cast<int64_t>(result.copied)},
                        {"removed", static_cast<int64_t>(result.deleted)}});
      return kExitOk;
    }
    if (ctx.json) {
      PrintCounts(ctx, {{"copied", static_cast<int64_t>(result.copied)}});
      return kExitOk;
    }
    ctx.out << result.copied << (result.copied == 1 ? " record" : " records") << " copied";
    if (move_) ctx.out << ", " << result.deleted << " removed from " << args.positional()[0];
    ctx.out << "\n";
    return kExitOk;
  }

 private:
  bool move_;
};

class CopyRecordsCommand : public TransferCommand {
 public:
  CopyRecordsCommand() : TransferCommand(false) {}
};
class MoveRecordsCommand : public TransferCommand {
 public:
  MoveRecordsCommand() : TransferCommand(true) {}
};

CX_REGISTER_COMMAND(CopyRecordsCommand);
CX_REGISTER_COMMAND(MoveRecordsCommand);

}  // namespace
}  // namespace cx::cli
