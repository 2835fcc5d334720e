// cardovex-generate: writes a generated database (every field type, values
// from a seeded generator) for benchmarks and trials.
//
//   cardovex-generate OUT.PDB [RECORDS] [SEED] [--extension]
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

#include "bench/generator.h"

int main(int argc, char** argv) {
  cx::bench::GeneratorOptions options;
  std::string out;
  int positional = 0;
  for (int i = 1; i < argc; ++i) {
    if (std::strcmp(argv[i], "--extension") == 0) {
      options.extension = true;
    } else if (positional == 0) {
      out = argv[i];
      ++positional;
    } else if (positional == 1) {
      options.records = std::strtoul(argv[i], nullptr, 10);
      ++positional;
    } else if (positional == 2) {
      options.seed = static_cast<uint32_t>(std::strtoul(argv[i], nullptr, 10));
      ++positional;
    } else {
      positional = -1;
      break;
    }
  }
  if (out.empty() || positional < 0 || options.records > 65504) {
    std::fprintf(stderr, "usage: cardovex-generate OUT.PDB [RECORDS (at most 65504)] [SEED] [--extension]\n");
    return 2;
  }
  cx::Status s = cx::bench::GenerateFile(out, options);
  if (!s) {
    std::fprintf(stderr, "%s\n", s.message().c_str());
    return 1;
  }
  return 0;
}
