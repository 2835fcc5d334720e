// beam FILE --to HOST[:PORT]: sends a database, one record or the records
// in view to another installation over OBEX.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json_output.h"
#include "design/security.h"
#include "infrared/beam_commands.h"
#include "platform/qt/qt_platform.h"

namespace cx::cli {
namespace {

class BeamCommand : public Command {
 public:
  std::string name() const override { return "beam"; }
  std::string summary() const override { return "send a database or records over OBEX (TCP)"; }
  void Declare(Syntax& syntax) const override {
    syntax.Positional("FILE")
        .About("Sends the whole database (at most 65535 bytes), its record N (index in table\n"
               "order, from 0) or the records in view to another device's OBEX receiver over\n"
               "TCP (default port 650). Without --to, the peers of the BeamPeers setting are\n"
               "tried in order. Asks the database's \"Beam Data\" access check first.\n")
        .Option("--to", "HOST[:PORT]", "a peer to try, in the order given", Take::kRepeatable)
        .Option("--record", "N", "send record N alone")
        .Flag("--records", "send the records in view")
        .Option("--wait", "SECONDS", "how long to keep looking for a peer (default 60)")
        .Form({"FILE", "--to", "--record|--records", "--wait"});
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    if (args.has("--record") && args.has("--records")) {
      return UsageError(ctx, *this, "--record and --records exclude each other");
    }
    const std::string path = args.positional()[0];
    Database db;
    if (!OpenForReading(ctx, path, db)) return kExitFailed;
    if (!Allowed(CheckAccess(db, secured::kBeamData, ctx.ui))) return kExitFailed;

    obex::BeamWhat what = obex::BeamWhat::kDatabase;
    std::optional<size_t> one;
    if (std::string error; !RecordOption(args, db, one, error)) return UsageError(ctx, *this, error);
    const size_t record = one.value_or(0);
    if (one) {
      what = obex::BeamWhat::kRecord;
    } else if (args.has("--records")) {
      what = obex::BeamWhat::kRecordsInView;
    }
    obex::BeamOptions options;
    if (auto w = args.value("--wait")) {
      auto n = ParseNumber(*w);
      if (!n || *n <= 0 || *n > 3600) return UsageError(ctx, *this, "--wait takes 1 to 3600 seconds");
      options.wait = std::chrono::seconds(*n);
    }
    std::vector<std::string> peers = args.values("--to");
    if (peers.empty()) peers = obex::BeamPeers(*OpenDesktopSettings());
    if (peers.empty()) return UsageError(ctx, *this, "no peer: give --to HOST[:PORT]");
    Status s = obex::BeamFile(path, what, record, peers, ctx.ui, options);
    if (!s) return Failure(ctx, s.message());
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(BeamCommand);

}  // namespace
}  // namespace cx::cli
