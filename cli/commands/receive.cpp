// receive: listens for beamed databases and records and stores them in the
// data folder.
#include <csignal>
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/json_output.h"
#include "design/receive_access.h"
#include "infrared/receiver.h"
#include "platform/data_folder.h"
#include "platform/qt/qt_platform.h"

namespace cx::cli {
namespace {

// Set by Ctrl-C; a signal handler can reach nothing else.
std::atomic<bool>& StopFlag() {
  static std::atomic<bool> stop{false};
  return stop;
}

extern "C" void OnStopSignal(int) { StopFlag() = true; }

class ReceiveCommand : public Command {
 public:
  std::string name() const override { return "receive"; }
  std::string summary() const override { return "receive beamed databases and records"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--yes", "--password"})
        .About("Listens for OBEX transfers over TCP (default: the ReceiveAddress setting, else\n"
               "0.0.0.0:6500, which needs no privileges) and stores what arrives in the data\n"
               "folder: a database is stored after asking (an existing one is replaced only\n"
               "when that is answered Yes), records are inserted into the database of the\n"
               "same name, which must be present. --yes answers every question Yes; without\n"
               "it the questions are asked on the terminal, or answered No when there is none.\n"
               "A received database is stored only when it opens whole. Records go through\n"
               "the \"Open Database\" and \"Add Records\" checks of their database: where one\n"
               "asks for the password, --password answers it; without it nothing is stored.\n"
               "Several peers are served at once; one that stops sending or reading is\n"
               "dropped after a time-out. Ctrl-C (SIGINT) or SIGTERM ends the command.\n")
        .Option("--listen", "HOST:PORT", "the address to listen on")
        .Option("--count", "N", "stop after N objects have arrived (default: run until Ctrl-C)")
        .Notes("Prints \"Listening on ADDR\" and one line per object.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    if (int code = RefuseJson(ctx, *this)) return code;
    obex::ReceiverOptions options;
    auto settings = OpenDesktopSettings();
    if (auto a = settings->Get(obex::kReceiveAddressSetting); a && !a->empty()) options.address = *a;
    if (auto a = args.value("--listen")) options.address = *a;
    if (auto c = args.value("--count")) {
      auto n = ParseNumber(*c);
      if (!n || *n <= 0) return UsageError(ctx, *this, "--count takes a positive number");
      options.count = static_cast<int>(*n);
    }
    StopFlag() = false;
    auto previousInt = std::signal(SIGINT, OnStopSignal);
    auto previousTerm = std::signal(SIGTERM, OnStopSignal);
    std::string folder = DataFolder(DesktopDocumentsFolder());
    AccessCheckedReceiveHooks hooks;
    Status s = obex::ReceiveIntoDataFolder(
        folder, ctx.ui, hooks, options, StopFlag(),
        [&](const std::string& address) { ctx.out << "Listening on " << address << std::endl; },
        [&](const std::string& line) { ctx.out << line << std::endl; });
    std::signal(SIGINT, previousInt);
    std::signal(SIGTERM, previousTerm);
    if (!s) return Failure(ctx, s.message());
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(ReceiveCommand);

}  // namespace
}  // namespace cx::cli
