// Build-time helper: writes cardovex-cli.1 and the bash completion script
// into the folder given, from the declarations of the commands linked in.
#include <fstream>
#include <iostream>
#include <string>

#include "cli/manual.h"

#ifndef CARDOVEX_VERSION
#define CARDOVEX_VERSION "0.0.0"
#endif

namespace {

bool WriteFile(const std::string& path, const std::string& text) {
  std::ofstream f(path, std::ios::binary | std::ios::trunc);
  f << text;
  f.close();
  if (!f) std::cerr << "make-manual: cannot write " << path << "\n";
  return static_cast<bool>(f);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::cerr << "usage: make-manual OUTPUT_FOLDER\n";
    return 2;
  }
  const std::string dir = argv[1];
  const bool ok = WriteFile(dir + "/cardovex-cli.1", cx::cli::ManPage(CARDOVEX_VERSION)) &&
                  WriteFile(dir + "/cardovex-cli.bash", cx::cli::BashCompletion());
  return ok ? 0 : 1;
}
