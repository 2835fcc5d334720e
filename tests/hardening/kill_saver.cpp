// Helper of the kill test: saves two versions of a database over the same
// file, one after the other, until it is killed. It writes one byte to
// standard output when the saving starts.
//
//   hardening_kill_saver PATH RECORDS SEED_A SEED_B
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "bench/generator.h"
#include "platform/clock.h"

int main(int argc, char** argv) {
  if (argc != 5) {
    std::fprintf(stderr, "usage: hardening_kill_saver PATH RECORDS SEED_A SEED_B\n");
    return 2;
  }
  const std::string path = argv[1];
  cx::bench::GeneratorOptions options;
  options.records = std::strtoul(argv[2], nullptr, 10);
  options.seed = static_cast<uint32_t>(std::strtoul(argv[3], nullptr, 10));
  cx::Database a = cx::bench::GenerateDatabase(path, options);
  options.seed = static_cast<uint32_t>(std::strtoul(argv[4], nullptr, 10));
  cx::Database b = cx::bench::GenerateDatabase(path, options);
  const cx::FixedClock clock(1700000000);

  if (::write(STDOUT_FILENO, "1", 1) != 1) return 1;
  // Bounded in case nobody comes to kill it.
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  for (int n = 0; std::chrono::steady_clock::now() < end; ++n) {
    cx::Database& db = n % 2 == 0 ? b : a;
    if (!db.SaveAs(path, clock)) return 1;
  }
  return 0;
}
