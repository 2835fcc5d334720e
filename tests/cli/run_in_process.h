// Runs the command-line tool inside the test process with its output
// captured, so tests see exactly what a user would on the terminal.
#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <optional>
#include <sstream>
#include <string>
#include <vector>

#include "cli/cli_ui.h"
#include "cli/global_options.h"

namespace cx::cli {

struct Result {
  int code;
  std::string out;
  std::string err;
};

// `before` goes ahead of the arguments (the conventions a test fixes,
// whatever the machine's locale says); `answer`, when given, answers every
// question the command asks.
inline Result RunInProcess(std::vector<std::string> args, const std::vector<std::string>& before = {},
                           std::optional<bool> answer = std::nullopt) {
  args.insert(args.begin(), before.begin(), before.end());
  std::ostringstream out, err;
  CliUi ui(err);
  if (answer) ui.SetAnswer(*answer);
  const int code = RunCli(args, out, err, ui);
  return {code, out.str(), err.str()};
}

// Questions and prompts go to the terminal when there is one; tests that
// need the refusal of a run without one (or must not hang on a prompt when
// run from a terminal) hold one of these.
class NoTerminalInput {
 public:
  NoTerminalInput() : saved_(::dup(STDIN_FILENO)) {
    const int null = ::open("/dev/null", O_RDONLY);
    ::dup2(null, STDIN_FILENO);
    ::close(null);
  }
  ~NoTerminalInput() {
    ::dup2(saved_, STDIN_FILENO);
    ::close(saved_);
  }
  NoTerminalInput(const NoTerminalInput&) = delete;
  NoTerminalInput& operator=(const NoTerminalInput&) = delete;

 private:
  int saved_;
};

}  // namespace cx::cli
