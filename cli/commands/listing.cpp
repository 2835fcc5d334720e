// listing FILE: the text listing of one record or of the records in view.
#include "cli/command.h"
#include "cli/commands/text_output.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "cli/text_files.h"
#include "design/link_access.h"
#include "ops/linked_listing.h"

namespace cx::cli {
namespace {

class ListingCommand : public Command {
 public:
  std::string name() const override { return "listing"; }
  std::string summary() const override { return "write records as a \"name: value\" text listing"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .About("Writes the records in view (or record N, its index in table order) as the\n"
               "Export Record(s) command does: per record one \"NAME: VALUE\" line for each\n"
               "used field marked Export/Print, in display order, then 40 dashes. A Link\n"
               "field lists its linked records in its place, indented by three blanks per\n"
               "level. Lines end in LF.\n")
        .Option("--record", "N", "record N alone")
        .Option("-o", "OUT",
                "write to OUT instead of standard output ('-'); a FIFO or device is written into")
        .Flag("--force", "write OUT even when it is a database or FILE itself");
    DeclareEncoding(syntax);
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    TextEncoding encoding;
    if (int code; !EncodingOption(ctx, *this, args, encoding, code)) return code;
    const std::string target = args.value("-o").value_or("-");
    if (target != "-" && !TextTargetAllowed(ctx, args, target, args.positional()[0])) {
      return kExitFailed;
    }
    Database db;
    if (!OpenForReading(ctx, args.positional()[0], db)) return kExitFailed;
    std::optional<size_t> record;
    if (std::string error; !RecordOption(args, db, record, error)) return UsageError(ctx, *this, error);
    const bool all = !record;
    const size_t current = record.value_or(0);
    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    LinkedRecordsListing linked(services, ctx.locale);
    const ListingContext listing{ctx.locale, &linked};
    Status written = WriteTextTo(ctx, target, encoding, [&](TextSink& sink) {
      WriteListing(db, all, current, sink, listing);
    });
    if (!written) return Failure(ctx, written.message());
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ListingCommand);

}  // namespace
}  // namespace cx::cli
