// Saving must never leave a damaged database behind: a process saving over
// and over is killed at random moments, and after every kill the file must
// be exactly the old or the new version and open cleanly.
#include <gtest/gtest.h>

#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "bench/generator.h"
#include "engine/record_store.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using Clock = std::chrono::steady_clock;

constexpr int kKills = 200;
constexpr size_t kRecords = 2000;
constexpr uint32_t kSeedA = 11, kSeedB = 22;

Bytes GeneratedBytes(const std::string& path, uint32_t seed) {
  bench::GeneratorOptions options;
  options.records = kRecords;
  options.seed = seed;
  EXPECT_TRUE(bench::GenerateFile(path, options, FixedClock(1700000000)).ok());
  Bytes bytes;
  EXPECT_TRUE(ReadWholeFile(path, bytes));
  return bytes;
}

// Starts the saver; returns its pid once it has begun saving, or -1.
pid_t StartSaver(const std::string& target, const std::string& a, const std::string& b) {
  int fds[2];
  if (::pipe(fds) != 0) return -1;
  pid_t pid = ::fork();
  if (pid == 0) {
    ::dup2(fds[1], STDOUT_FILENO);
    ::close(fds[0]);
    ::close(fds[1]);
    ::execl(CARDOVEX_KILL_SAVER, CARDOVEX_KILL_SAVER, target.c_str(), a.c_str(), b.c_str(),
            static_cast<char*>(nullptr));
    ::_exit(127);
  }
  ::close(fds[1]);
  pollfd p{fds[0], POLLIN, 0};
  char ready = 0;
  bool ok = pid > 0 && ::poll(&p, 1, 20000) == 1 && ::read(fds[0], &ready, 1) == 1;
  ::close(fds[0]);
  if (!ok && pid > 0) {
    ::kill(pid, SIGKILL);
    ::waitpid(pid, nullptr, 0);
    return -1;
  }
  return pid;
}

std::vector<std::string> Leftovers(const testing::TempDir& dir, const std::string& target) {
  std::vector<std::string> others;
  for (const std::string& name : ListFiles(dir.path())) {
    if (name != target) others.push_back(name);
  }
  return others;
}

TEST(KillTest, FileIsAlwaysOldOrNewVersion) {
  // The two versions live in a folder of their own; the saver opens them.
  testing::TempDir versions;
  const Bytes versionA = GeneratedBytes(versions.File("A.PDB"), kSeedA);
  const Bytes versionB = GeneratedBytes(versions.File("B.PDB"), kSeedB);
  testing::TempDir dir;
  const std::string target = "Kill.PDB";
  const std::string path = dir.File(target);
  ASSERT_NE(versionA, versionB);

  // Kills are spread over a few saves' time.
  auto start = Clock::now();
  for (int i = 0; i < 3; ++i) ASSERT_TRUE(WriteFileSafely(path, versionA.data(), versionA.size()).ok());
  auto saveTime = std::chrono::duration_cast<std::chrono::microseconds>(Clock::now() - start) / 3;
  const long maxDelay = std::clamp<long>(3 * saveTime.count(), 2000, 100000);

  std::mt19937 rng(20240601);
  int leftA = 0, leftB = 0, midWrite = 0;
  for (int kill = 0; kill < kKills; ++kill) {
    ASSERT_TRUE(WriteFileSafely(path, versionA.data(), versionA.size()).ok());
    pid_t pid = StartSaver(path, versions.File("A.PDB"), versions.File("B.PDB"));
    ASSERT_GT(pid, 0) << "the saver did not start";
    std::this_thread::sleep_for(std::chrono::microseconds(rng() % maxDelay));
    ASSERT_EQ(::kill(pid, SIGKILL), 0);
    int status = 0;
    ASSERT_EQ(::waitpid(pid, &status, 0), pid);
    ASSERT_TRUE(WIFSIGNALED(status)) << "the saver ended on its own, status " << status;

    Bytes now;
    ASSERT_TRUE(ReadWholeFile(path, now)) << "kill " << kill;
    ASSERT_TRUE(now == versionA || now == versionB) << "kill " << kill << ": a mixed or cut file";
    (now == versionA ? leftA : leftB)++;

    SilentUi ui;
    Database db;
    ASSERT_TRUE(db.Open(path, ui).ok()) << "kill " << kill;
    EXPECT_EQ(db.recordCount(), kRecords);
    EXPECT_FALSE(db.partial());

    // At most the one temporary file being written when the kill came;
    // never named like a database.
    std::vector<std::string> others = Leftovers(dir, target);
    ASSERT_LE(others.size(), 1u) << "kill " << kill;
    for (const std::string& name : others) {
      EXPECT_TRUE(IsTemporaryNameFor(target, name)) << name;
      EXPECT_FALSE(name.size() >= 4 && (name.substr(name.size() - 4) == ".PDB" ||
                                        name.substr(name.size() - 4) == ".pdb"))
          << name;
      RemoveFile(dir.File(name));
      ++midWrite;
    }
  }
  std::printf("%d kills (up to %ld us after saving began): old version %d, new version %d, "
              "killed while writing %d\n",
              kKills, maxDelay, leftA, leftB, midWrite);
  // The kills must really have landed on both sides of a save.
  EXPECT_GT(leftA, 0);
  EXPECT_GT(leftB, 0);
  EXPECT_GT(midWrite, 0);
}

}  // namespace
}  // namespace cx
