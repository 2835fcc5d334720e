// delete-records FILE --within|--outside|--all: the "Delete Records" dialog
// from the command line.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "design/link_access.h"
#include "ops/delete_records.h"
#include "ops/links.h"
#include "ops/open_database.h"

namespace cx::cli {
namespace {

class DeleteRecordsCmd : public Command {
 public:
  std::string name() const override { return "delete-records"; }
  std::string summary() const override { return "delete the records within or outside the filter range, or all"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--password PW] [--yes|--no] delete-records FILE\n"
           "                    --within|--outside|--all\n"
           "Deletes records and saves FILE:\n"
           "  --within    \"All Records _Within_ Filter Range\": the records in view\n"
           "  --outside   \"All Records _Outside_ Filter Range\": the others (none when\n"
           "              both filters are off)\n"
           "  --all       \"All Records\"\n"
           "Needs the \"Delete Records\" access. When FILE has Link fields the question\n"
           "\"Would you like to delete the linked records also? (Y/N)\" is answered by\n"
           "--yes (the linked records in the other databases go too, each database\n"
           "under its own access check) or --no; without either nothing is deleted.\n"
           "Calculated fields are brought up to date afterwards.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {}, {"--within", "--outside", "--all"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 1) return UsageError(ctx, *this, "expected FILE");
    const int scopes = args.has("--within") + args.has("--outside") + args.has("--all");
    if (scopes != 1) return UsageError(ctx, *this, "give exactly one of --within, --outside, --all");
    const DeleteScope scope = args.has("--within")    ? DeleteScope::WithinFilterRange
                              : args.has("--outside") ? DeleteScope::OutsideFilterRange
                                                      : DeleteScope::All;
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    if (!PassAccessCheck(ctx, db, secured::kDeleteRecords)) return kExitFailed;
    DataSession session(db, ctx.locale, ctx.ui);
    RunPendingWork(session);

    bool alsoLinked = false;
    if (HasLinkFields(db)) {
      alsoLinked = ctx.ui.AskYesNo(link_messages::kDeleteLinkedQuestion, "QUESTION");
      if (!QuestionsAnswered(ctx)) return kExitFailed;
    }
    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    LinkedRecordsDeleter linked(services);
    const size_t deleted = DeleteRecords(session, scope, alsoLinked ? &linked : nullptr);
    if (db.changed() && !SaveForCommand(ctx, db)) return kExitFailed;
    ctx.out << deleted << (deleted == 1 ? " record" : " records") << " deleted, " << db.recordCount()
            << " left\n";
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(DeleteRecordsCmd);

}  // namespace
}  // namespace cx::cli
