// The command-line tool where a careless or an unlucky run could lose data:
// moves into targets that cannot be saved, many processes on one database,
// text written over a database, FIFOs and devices, output that cannot be
// written. Some cases run the real program in child processes.
#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <sstream>
#include <thread>

#include "cli/global_options.h"
#include "engine/record_store.h"
#include "platform/file_io.h"
#include "tests/cli/program_run.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

using testing::TempDir;

Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args)); }

Bytes FileBytes(const std::string& path) {
  Bytes b;
  EXPECT_TRUE(ReadWholeFile(path, b)) << path;
  return b;
}

size_t RecordCount(const std::string& path) {
  SilentUi ui;
  Database db;
  return db.Open(path, ui).ok() ? db.recordCount() : SIZE_MAX;
}

// A database of two text fields and a number holding `records` records.
std::string MakeDatabase(const std::string& path, int records) {
  Result r = Cli({"new", path, "--name", "Notes", "--field", "Title:Text", "--field", "Body:Text",
                  "--field", "Count:Integer"});
  EXPECT_EQ(r.code, 0) << r.err;
  if (records > 0) {
    std::string csv;
    for (int i = 0; i < records; ++i) csv += "title " + std::to_string(i) + ",body," + std::to_string(i) + "\n";
    WriteText(path + ".csv", csv);
    r = Cli({"import-csv", path, path + ".csv"});
    EXPECT_EQ(r.code, 0) << r.err;
    ::unlink((path + ".csv").c_str());
  }
  return path;
}

Result RunProgram(const TempDir& dir, const std::vector<std::string>& args,
                  const std::string& stdoutPath = "", int seconds = 20) {
  const std::string out = stdoutPath.empty() ? dir.File("stdout.txt") : stdoutPath;
  pid_t pid = Spawn(args, out, dir.File("stderr.txt"));
  int code = Await(pid, std::chrono::steady_clock::now() + std::chrono::seconds(seconds));
  return {code, stdoutPath.empty() ? ReadText(out) : "", ReadText(dir.File("stderr.txt"))};
}

TEST(MoveRecords, TargetThatCannotBeSavedKeepsEveryRecordInTheSource) {
  TempDir dir;
  const std::string source = MakeDatabase(dir.File("Source.PDB"), 3);
  const std::string target = MakeDatabase(dir.File("Target.PDB"), 0);
  ASSERT_EQ(::chmod(target.c_str(), 0444), 0);
  const Bytes before = FileBytes(source), targetBefore = FileBytes(target);
  Result r = Cli({"move-records", source, target});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find(target), std::string::npos) << r.err;
  EXPECT_NE(r.err.find("read-only"), std::string::npos) << r.err;
  EXPECT_EQ(FileBytes(source), before);
  EXPECT_EQ(FileBytes(target), targetBefore);
  // Copying fails the same way rather than claiming success.
  EXPECT_EQ(Cli({"copy-records", source, target}).code, 1);
}

TEST(MoveRecords, FullDiskUnderTheTargetKeepsTheSource) {
  testing::SmallTmpfs disk(256 * 1024);
  if (!disk.ok()) GTEST_SKIP() << disk.why();
  TempDir dir;
  const std::string source = MakeDatabase(dir.File("Source.PDB"), 50);
  const std::string target = MakeDatabase(disk.File("Target.PDB"), 0);
  ASSERT_TRUE(disk.FillUp());
  const Bytes before = FileBytes(source), targetBefore = FileBytes(target);
  Result r = Cli({"move-records", source, target});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("No space"), std::string::npos) << r.err;
  EXPECT_EQ(FileBytes(source), before);
  EXPECT_EQ(FileBytes(target), targetBefore);
  EXPECT_EQ(RecordCount(source), 50u);
}

TEST(MoveRecords, LongButLegalTargetNameIsSavedAndMovedInto) {
  TempDir dir;
  const std::string source = MakeDatabase(dir.File("Source.PDB"), 2);
  const std::string target = MakeDatabase(dir.File(std::string(236, 't') + ".PDB"), 0);
  Result r = Cli({"move-records", source, target});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(RecordCount(source), 0u);
  EXPECT_EQ(RecordCount(target), 2u);
}

TEST(Concurrency, TwentyImportsAtOnceAllArrive) {
  TempDir dir;
  const std::string db = MakeDatabase(dir.File("Shared.PDB"), 0);
  constexpr int kProcesses = 20;
  std::vector<pid_t> pids;
  for (int i = 0; i < kProcesses; ++i) {
    const std::string csv = dir.File("one" + std::to_string(i) + ".csv");
    WriteText(csv, "from process " + std::to_string(i) + ",x," + std::to_string(i) + "\n");
    pids.push_back(Spawn({"import-csv", db, csv}, "/dev/null", dir.File("err" + std::to_string(i))));
  }
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(90);
  for (int i = 0; i < kProcesses; ++i) {
    EXPECT_EQ(Await(pids[i], deadline), 0) << ReadText(dir.File("err" + std::to_string(i)));
  }
  EXPECT_EQ(RecordCount(db), static_cast<size_t>(kProcesses));
}

TEST(Concurrency, ReadersShareAFileThatAWriterHolds) {
  TempDir dir;
  const std::string db = MakeDatabase(dir.File("Read.PDB"), 2);
  // Another reader (here the test) does not hold up queries and exports...
  FileLock reading;
  ASSERT_TRUE(reading.Acquire(db, 1000, FileLock::Kind::kShared).ok());
  Result records = RunProgram(dir, {"records", db}, "", 10);
  EXPECT_EQ(records.code, 0) << records.err;
  EXPECT_EQ(RunProgram(dir, {"export-csv", db, dir.File("out.csv")}, "", 10).code, 0);
  // ...but a change waits until the reader is done.
  pid_t add = Spawn({"add", db, "0=late"}, "/dev/null", dir.File("add.err"));
  EXPECT_EQ(Await(add, std::chrono::steady_clock::now() + std::chrono::milliseconds(300)), -1);
  reading.Release();
  EXPECT_EQ(RecordCount(db), 2u);
  add = Spawn({"add", db, "0=late"}, "/dev/null", dir.File("add.err"));
  EXPECT_EQ(Await(add, std::chrono::steady_clock::now() + std::chrono::seconds(20)), 0)
      << ReadText(dir.File("add.err"));
  EXPECT_EQ(RecordCount(db), 3u);
}

TEST(Concurrency, SaveOverAFileChangedSinceOpeningIsRefused) {
  // A program that does not take the lock (here the test itself) still
  // never overwrites what a command saved in the meantime.
  TempDir dir;
  const std::string source = MakeDatabase(dir.File("Source.PDB"), 2);
  const std::string db = MakeDatabase(dir.File("Edited.PDB"), 1);
  Database mine;
  SilentUi ui;
  ASSERT_TRUE(mine.Open(db, ui).ok());
  ASSERT_EQ(Cli({"move-records", source, db}).code, 0);
  mine.DeleteRecord(0);
  Status s = mine.Save();
  ASSERT_FALSE(s.ok());
  EXPECT_NE(s.message().find(db), std::string::npos);
  EXPECT_EQ(RecordCount(db), 3u);
}

TEST(TextExports, NeverReplaceADatabaseOrTheInputUnlessForced) {
  TempDir dir;
  const std::string db = MakeDatabase(dir.File("Data.PDB"), 2);
  const std::string other = MakeDatabase(dir.File("Other.PDB"), 1);
  const Bytes dbBefore = FileBytes(db), otherBefore = FileBytes(other);
  for (const auto& args : std::vector<std::vector<std::string>>{
           {"export-csv", db, other},
           {"export-csv", db, db},
           {"report", db, "Count", "-o", db},
           {"listing", db, "-o", other}}) {
    Result r = Cli(args);
    EXPECT_EQ(r.code, 1) << args[0];
    EXPECT_NE(r.err.find("--force"), std::string::npos) << r.err;
  }
  EXPECT_EQ(FileBytes(db), dbBefore);
  EXPECT_EQ(FileBytes(other), otherBefore);

  // An ordinary text file is replaced as before; --force replaces anything.
  WriteText(dir.File("old.csv"), "old text\n");
  EXPECT_EQ(Cli({"export-csv", db, dir.File("old.csv")}).code, 0);
  EXPECT_EQ(ReadText(dir.File("old.csv")), "title 0,body,0\ntitle 1,body,1\n");
  EXPECT_EQ(Cli({"export-csv", db, other, "--force"}).code, 0);
  EXPECT_EQ(ReadText(other), "title 0,body,0\ntitle 1,body,1\n");
}

TEST(SpecialFiles, FifoGivenAsADatabaseFailsAtOnce) {
  TempDir dir;
  const std::string fifo = dir.File("Waiting.PDB");
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  for (const char* command : {"info", "records", "import-csv"}) {
    std::vector<std::string> args{command, fifo};
    if (std::string(command) == "import-csv") args.push_back(fifo);
    Result r = RunProgram(dir, args, "", 10);
    EXPECT_EQ(r.code, 1) << command << " (-1: it blocked)";
    EXPECT_NE(r.err.find(fifo), std::string::npos) << r.err;
  }
  EXPECT_TRUE(S_ISFIFO([&] { struct stat st{}; ::lstat(fifo.c_str(), &st); return st.st_mode; }()));
}

TEST(SpecialFiles, ExportIntoAFifoGoesThroughIt) {
  TempDir dir;
  const std::string db = MakeDatabase(dir.File("Data.PDB"), 2);
  const std::string fifo = dir.File("pipe");
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  int reader = ::open(fifo.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  ASSERT_GE(reader, 0);
  pid_t pid = Spawn({"export-csv", db, fifo}, dir.File("out"), dir.File("err"));
  std::string got;
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
  while (std::chrono::steady_clock::now() < deadline) {
    pollfd p{reader, POLLIN, 0};
    if (::poll(&p, 1, 50) <= 0) continue;
    char buf[256];
    ssize_t n = ::read(reader, buf, sizeof buf);
    if (n > 0) got.append(buf, static_cast<size_t>(n));
    if (n == 0 && !got.empty()) break;
  }
  ::close(reader);
  EXPECT_EQ(Await(pid, deadline + std::chrono::seconds(1)), 0) << ReadText(dir.File("err"));
  EXPECT_EQ(got, "title 0,body,0\ntitle 1,body,1\n");
  struct stat st{};
  ASSERT_EQ(::lstat(fifo.c_str(), &st), 0);
  EXPECT_TRUE(S_ISFIFO(st.st_mode));
}

TEST(OutputFailures, FullDeviceMakesTheCommandFail) {
  TempDir dir;
  const std::string db = MakeDatabase(dir.File("Data.PDB"), 2000);
  for (const auto& args : std::vector<std::vector<std::string>>{
           {"records", db}, {"export-csv", db, "-"}, {"listing", db}, {"info", db}}) {
    Result r = RunProgram(dir, args, "/dev/full");
    EXPECT_EQ(r.code, 1) << args[0] << ": " << r.err;
    EXPECT_NE(r.err.find("No space"), std::string::npos) << args[0] << ": " << r.err;
  }
  // A full device named as the output file (a node of its own, so that a
  // failure here cannot damage the system's).
  const std::string full = dir.File("full");
  if (::mknod(full.c_str(), S_IFCHR | 0666, makedev(1, 7)) != 0) {
    GTEST_SKIP() << "cannot make a device node here";
  }
  for (const auto& args : std::vector<std::vector<std::string>>{
           {"export-csv", db, full}, {"report", db, "Count", "-o", full}, {"listing", db, "-o", full}}) {
    Result r = Cli(args);
    EXPECT_EQ(r.code, 1) << args[0];
    struct stat st{};
    ASSERT_EQ(::lstat(full.c_str(), &st), 0);
    EXPECT_TRUE(S_ISCHR(st.st_mode)) << args[0] << " replaced the device node";
  }
}

}  // namespace
}  // namespace cx::cli
