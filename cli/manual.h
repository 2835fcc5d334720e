// The manual page and the bash completion script, both made from the help
// texts the tool prints, so that neither can drift from what it accepts.
#pragma once

#include <string>
#include <vector>

namespace cx::cli {

// The long options a help text names, in the order they first appear, and
// among them those written with a value ("--name VALUE" or "--name=VALUE").
struct HelpOptions {
  std::vector<std::string> all;
  std::vector<std::string> withValue;
};
HelpOptions OptionsInHelp(const std::string& help);
class Syntax;
// The same, from a declaration.
HelpOptions DeclaredOptions(const Syntax& syntax);

// The page in man(7) markup.
std::string ManPage(const std::string& version);
// A script for bash-completion: commands, each command's options, and file
// names everywhere else.
std::string BashCompletion();

}  // namespace cx::cli
