// delete FILE --within|--outside|--all: the "Delete Records" command of the
// main view, from the command line.
#include <ostream>

#include "cli/command.h"
#include "cli/command_document.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "design/link_access.h"
#include "ops/delete_records.h"
#include "ops/links.h"

namespace cx::cli {
namespace {

class DeleteCommand : public Command {
 public:
  std::string name() const override { return "delete"; }
  std::string summary() const override { return "delete the records within or outside the filter range, or all"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password", "--yes|--no"})
        .Positional("FILE")
        .Form({"FILE", "(--within|--outside|--all|--record)"})
        .About("Deletes records and saves FILE:\n")
        .Flag("--within", "\"All Records _Within_ Filter Range\": the records in view")
        .Flag("--outside",
              "\"All Records _Outside_ Filter Range\": the others (none when both filters are off)")
        .Flag("--all", "\"All Records\"")
        .Option("--record", "INDEX", "the one record INDEX (as 'records' numbers it)")
        .Notes("Needs the \"Delete Records\" access. When FILE has Link fields the question\n"
               "\"Would you like to delete the linked records also? (Y/N)\" is answered by\n"
               "--yes (the linked records in the other databases go too, each database\n"
               "under its own access check) or --no; without either it is asked on the\n"
               "terminal, and with no terminal refused: nothing is deleted, exit status 1.\n"
               "Calculated fields are brought up to date afterwards.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const int scopes = args.has("--within") + args.has("--outside") + args.has("--all") + args.has("--record");
    if (scopes != 1) {
      return UsageError(ctx, *this, "give exactly one of --within, --outside, --all, --record");
    }
    if (args.has("--record")) return DeleteOne(ctx, args);
    const DeleteScope scope = args.has("--within")    ? DeleteScope::WithinFilterRange
                              : args.has("--outside") ? DeleteScope::OutsideFilterRange
                                                      : DeleteScope::All;
    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForCommand(ctx, args.positional()[0], session)) return kExitFailed;
    if (!PassAccessCheck(ctx, db, secured::kDeleteRecords)) return kExitFailed;

    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    LinkedRecordsDeleter linked(services);
    // An unanswered linked-records question reads as No, which deletes
    // nothing linked; what was deleted here is then not saved.
    const size_t deleted = DeleteRecordsCommand(session, scope, &linked);
    if (!QuestionsAnswered(ctx)) return kExitFailed;
    if (db.changed() && !SaveForCommand(ctx, db)) return kExitFailed;
    if (ctx.json) {
      PrintCounts(ctx, {{"deleted", static_cast<int64_t>(deleted)},
                        {"left", static_cast<int64_t>(db.recordCount())}});
      return kExitOk;
    }
    ctx.out << deleted << (deleted == 1 ? " record" : " records") << " deleted, " << db.recordCount()
            << " left\n";
    return kExitOk;
  }

 private:
  // The list's "Delete Record": the command line itself is the confirmation,
  // so only the linked-records question is asked.
  int DeleteOne(Context& ctx, const Arguments& args) {
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    std::optional<size_t> record;
    std::string error;
    if (!RecordOption(args, db, record, error)) return UsageError(ctx, *this, error);
    if (!PassAccessCheck(ctx, db, secured::kDeleteRecords)) return kExitFailed;
    const bool alsoLinked =
        HasLinkFields(db) && ctx.ui.AskYesNo(link_messages::kDeleteLinkedQuestion, "QUESTION");
    if (!QuestionsAnswered(ctx)) return kExitFailed;
    CommandDocument cd(ctx, db);
    if (!cd.doc().DeleteRecord(*record, alsoLinked)) return Failure(ctx, "the record could not be deleted");
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    ctx.out << "record " << *record << " deleted, " << db.recordCount() << " left\n";
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(DeleteCommand);

}  // namespace
}  // namespace cx::cli
