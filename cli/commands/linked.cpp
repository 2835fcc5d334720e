// linked FILE RECORD FIELD: the records a Link field of a record leads to.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/record_output.h"
#include "design/link_access.h"
#include "ops/links.h"

namespace cx::cli {
namespace {

class LinkedCommand : public Command {
 public:
  std::string name() const override { return "linked"; }
  std::string summary() const override { return "list the records a Link field leads to"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json", "--password"})
        .Positional("FILE")
        .Positional("RECORD")
        .Positional("FIELD")
        .About("Opens the database that Link field FIELD (a slot number 0-29 or a name) of\n"
               "record RECORD (its index in table order) names, in FILE's folder, and lists\n"
               "the records linked to that record exactly as `records` lists records: those\n"
               "whose \"Other Field #\" holds the record's link value and that pass the\n"
               "linked database's filters.\n")
        .Flag("--all", "the linked records whatever the filters say")
        .Notes("The linked database must pass its \"Open Database\" access check.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    Database db;
    if (!OpenForReading(ctx, args.positional()[0], db)) return kExitFailed;
    auto record = ParseNumber(args.positional()[1]);
    if (!record || *record < 0 || static_cast<size_t>(*record) >= db.recordCount()) {
      return UsageError(ctx, *this, "RECORD must be a record index below " +
                                        std::to_string(db.recordCount()));
    }
    const int slot = ResolveField(db, args.positional()[2]);
    if (slot < 0 || db.schema().field[slot].type() != FieldType::Link) {
      return UsageError(ctx, *this, args.positional()[2] + " is not a Link field");
    }
    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    LinkedDatabase linked =
        OpenLinkedDatabase(slot, db, static_cast<size_t>(*record), LinkAccess::Open, services);
    if (!linked) return kExitFailed;
    const Database& other = linked.db();
    std::vector<size_t> rows;
    if (args.has("--all")) {
      rows = LinkedRecordIndexes(other, linked.restriction());
    } else {
      for (uint32_t i : RebuildView(other, &linked.restriction())) rows.push_back(i);
    }
    WriteRecords(ctx, other, rows);
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(LinkedCommand);

}  // namespace
}  // namespace cx::cli
