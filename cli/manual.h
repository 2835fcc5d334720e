// The manual page and the bash completion script, both made from the
// commands' declarations (the page through the help texts they give), so
// that neither can drift from what the tool accepts.
#pragma once

#include <string>

namespace cx::cli {


// The page in man(7) markup.
std::string ManPage(const std::string& version);
// A script for bash-completion: commands, each command's options, and file
// names everywhere else.
std::string BashCompletion();

}  // namespace cx::cli
