// cardovex-cli: the command-line companion of Cardovex.
#include <iostream>
#include <string>
#include <vector>

#include "cli/command.h"
#include "cli/global_options.h"

int main(int argc, char** argv) {
  std::vector<std::string> args(argv + 1, argv + argc);
  cx::cli::CliUi ui(std::cerr);
  return cx::cli::RunCli(args, std::cout, std::cerr, ui);
}
