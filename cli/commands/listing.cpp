// listing FILE: the text listing of one record or of the records in view.
#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/text_output.h"
#include "cli/database_access.h"
#include "design/link_access.h"
#include "ops/linked_listing.h"

namespace cx::cli {
namespace {

class ListingCommand : public Command {
 public:
  std::string name() const override { return "listing"; }
  std::string summary() const override { return "write records as a \"name: value\" text listing"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--password PW] listing FILE [--record N]\n"
           "                                          [-o OUT [--force]]\n"
           "Writes the records in view (or record N, its index in table order) as the\n"
           "Export Record(s) command does: per record one \"NAME: VALUE\" line for each\n"
           "used field marked Export/Print, in display order, then 40 dashes. A Link\n"
           "field lists its linked records in its place, indented by three blanks per\n"
           "level. Lines end in LF.\n"
           "  -o OUT   write to OUT (Windows-1252) instead of standard output (UTF-8);\n"
           "           a FIFO or device is written into\n"
           "  --force  write OUT even when it is a database or FILE itself\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {"--record", "-o"}, {"--force"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 1) return UsageError(ctx, *this, "expected FILE");
    if (auto out = args.value("-o"); out && !TextTargetAllowed(ctx, args, *out, args.positional()[0])) {
      return kExitFailed;
    }
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    std::optional<size_t> record;
    if (std::string error; !RecordOption(args, db, record, error)) return UsageError(ctx, *this, error);
    const bool all = !record;
    const size_t current = record.value_or(0);
    LinkServices services = SecuredLinkServices(ctx.ui, &ctx.locale);
    LinkedRecordsListing linked(services, ctx.locale);
    const ListingContext listing{ctx.locale, &linked};
    if (auto out = args.value("-o")) {
      if (Status s = WriteListingFile(db, all, current, *out, listing); !s) {
        return Failure(ctx, s.message());
      }
      return kExitOk;
    }
    Utf8StreamSink sink(ctx.out);
    WriteListing(db, all, current, sink, listing);
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ListingCommand);

}  // namespace
}  // namespace cx::cli
