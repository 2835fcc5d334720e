// The global options shared by every command and the dispatch to the
// command named on the line.
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

#include "cli/cli_ui.h"

namespace cx::cli {

// Runs one command line (without the program name). Returns the exit code.
int RunCli(const std::vector<std::string>& args, std::ostream& out, std::ostream& err, CliUi& ui);

// The text of --help.
std::string GeneralHelp();

}  // namespace cx::cli
