// Helper of the kill test: opens two versions of a database and saves them
// over the same file, one after the other, until it is killed. It writes
// one byte to standard output when the saving starts.
//
//   hardening_kill_saver TARGET VERSION_A VERSION_B
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <string>

#include "engine/record_store.h"
#include "platform/clock.h"
#include "platform/ui_port.h"

int main(int argc, char** argv) {
  if (argc != 4) {
    std::fprintf(stderr, "usage: hardening_kill_saver TARGET VERSION_A VERSION_B\n");
    return 2;
  }
  const std::string target = argv[1];
  cx::SilentUi ui;
  cx::Database a, b;
  if (!a.Open(argv[2], ui) || !b.Open(argv[3], ui)) return 1;
  const cx::FixedClock clock(1700000000);

  if (::write(STDOUT_FILENO, "1", 1) != 1) return 1;
  // Bounded in case nobody comes to kill it.
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(30);
  for (int n = 0; std::chrono::steady_clock::now() < end; ++n) {
    cx::Database& db = n % 2 == 0 ? b : a;
    // The other object wrote the file last; replacing it is the point here.
    db.AcceptDiskState();
    if (!db.SaveAs(target, clock)) return 1;
  }
  return 0;
}
