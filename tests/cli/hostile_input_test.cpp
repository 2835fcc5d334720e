// The command-line tool against what a careless or hostile user gives it:
// texts a database cannot hold, files as large as the format allows, CSV
// that does not fit the fields.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <sstream>

#include "cli/global_options.h"
#include "engine/record_store.h"
#include "platform/file_io.h"
#include "tests/engine/test_databases.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args), {"--date-format", "M/d/yyyy", "--time-format", "HH:mm:ss", "--no"}); }

const std::string kSnowman = "\xE2\x98\x83";  // U+2603, not in Windows-1252

class UnstorableText : public ::testing::Test {
 protected:
  void SetUp() override {
    path = dir.File("Notes.PDB");
    Result r = Cli({"new", path, "--name", "Notes", "--field", "Name:Text", "--field",
                    "Kind:Pop-Up:items=A|B"});
    ASSERT_EQ(r.code, 0) << r.err;
    before = testing::ReadBytes(path);
  }
  // Refused as a usage error that names the character, the file untouched.
  void ExpectRefused(std::vector<std::string> args) {
    Result r = Cli(args);
    EXPECT_EQ(r.code, 2) << args[0] << ": " << r.err;
    EXPECT_NE(r.err.find("U+2603"), std::string::npos) << r.err;
    EXPECT_EQ(testing::ReadBytes(path), before) << args[0];
  }
  testing::TempDir dir;
  std::string path;
  testing::ByteVector before;
};

TEST_F(UnstorableText, EveryStoredTextIsRefusedRatherThanTurnedIntoQuestionMarks) {
  ExpectRefused({"security", path, "--set-password", kSnowman + kSnowman});
  ExpectRefused({"rename", path, "N" + kSnowman});
  ExpectRefused({"author", path, "--author", kSnowman});
  ExpectRefused({"author", path, "--comments", "ok " + kSnowman});
  ExpectRefused({"set-field", path, "Name", "--name", kSnowman});
  ExpectRefused({"popups", path, "Kind", "add", "C", kSnowman});
  ExpectRefused({"popups", path, "Kind", "rename", "A", kSnowman});
  ExpectRefused({"find", path, kSnowman});
  ExpectRefused({"filter", path, "--filter1", "Name=" + kSnowman});
  ExpectRefused({"new", dir.File("Other.PDB"), "--name", kSnowman, "--field", "A:Text"});
  ExpectRefused({"new", dir.File("Other.PDB"), "--name", "Other", "--field", kSnowman + ":Text"});
  EXPECT_FALSE(FileExists(dir.File("Other.PDB")));
  // Characters Windows-1252 does hold still go in.
  EXPECT_EQ(Cli({"rename", path, "Caf\xC3\xA9 \xE2\x82\xAC"}).code, 0);
}

TEST_F(UnstorableText, QuestionMarkPasswordDoesNotOpenForOtherCharacters) {
  ASSERT_EQ(Cli({"security", path, "Open Database", "Password Required", "--set-password", "??"}).code, 0);
  Result r = Cli({"--password", kSnowman + kSnowman, "info", path});
  EXPECT_EQ(r.code, 2);
  EXPECT_EQ(r.out, "");
  EXPECT_EQ(Cli({"--password", "??", "info", path}).code, 0);
}

TEST(CsvImportReport, CountsOnStderrAndStrictChangesNothing) {
  testing::TempDir dir;
  const std::string path = dir.File("Tasks.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Tasks", "--field", "Name:Text:size=8", "--field",
                 "Done:Check-Box", "--field", "Due:Date"}).code, 0);
  const std::string csv = dir.File("in.csv");
  const std::string text = "Paint,1,3/1/2026\nSand,yes,3/2/2026\nA much longer name,0,\n"
                           "Fix,0,someday\n\"Clean,1\n";
  ASSERT_TRUE(WriteFileSafely(csv, text.data(), text.size()).ok());
  const testing::ByteVector before = testing::ReadBytes(path);

  Result strict = Cli({"import-csv", path, csv, "--strict"});
  EXPECT_EQ(strict.code, 1);
  EXPECT_EQ(testing::ReadBytes(path), before);
  EXPECT_NE(strict.err.find("4 lines hold"), std::string::npos) << strict.err;

  // More lines than are named: the count stays whole, the list stops.
  std::string many;
  for (int i = 0; i < 8; ++i) many += "T" + std::to_string(i) + ",maybe,\n";
  const std::string manyCsv = dir.File("many.csv");
  ASSERT_TRUE(WriteFileSafely(manyCsv, many.data(), many.size()).ok());
  Result counted = Cli({"import-csv", path, manyCsv, "--strict"});
  EXPECT_EQ(counted.code, 1);
  EXPECT_NE(counted.err.find("8 lines hold values that are not stored as given; the first of them:\n"),
            std::string::npos)
      << counted.err;
  EXPECT_NE(counted.err.find("line 5,"), std::string::npos);
  EXPECT_EQ(counted.err.find("line 6,"), std::string::npos);

  Result r = Cli({"import-csv", path, csv});
  EXPECT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "5 records imported\n");
  EXPECT_EQ(r.err,
            "import-csv: 4 lines hold values that are not stored as given:\n"
            "  line 2, field \"Done\" (Check-Box): \"yes\" cannot be read\n"
            "  line 3, field \"Name\" (Text): \"A much longer name\" was cut to 8 characters\n"
            "  line 4, field \"Due\" (Date): \"someday\" cannot be read\n"
            "  line 5: a quote is never closed, so the rest of the file became one value\n");
}

// An address-space limit cannot hold under AddressSanitizer, which reserves
// terabytes of shadow memory up front; there the peak resident size alone
// tells whether the records were loaded.
#if defined(__SANITIZE_ADDRESS__)
constexpr bool kLimitAddressSpace = false;
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
constexpr bool kLimitAddressSpace = false;
#else
constexpr bool kLimitAddressSpace = true;
#endif
#else
constexpr bool kLimitAddressSpace = true;
#endif

// The largest file the format allows: 65504 data records, the last offsets
// close to 4 GB. Made sparse, so it costs no disk space; the commands that
// only show settings must answer from the head alone, within a memory limit
// far below the file's size.
TEST(LargestFile, ShowingSettingsReadsOnlyTheHead) {
  testing::TempDir dir;
  const std::string path = dir.File("Huge.PDB");
  std::vector<testing::RawRecord> records = testing::StandardRecords();
  const size_t head = records.size();
  records.resize(head + format::kMaxDataRecords);
  testing::ByteVector file = testing::BuildPdb(records);
  const uint32_t dataStart = testing::EntryOffset(file, head);
  for (size_t i = 0; i < format::kMaxDataRecords; ++i) {
    testing::SetEntryOffset(file, head + i, dataStart + static_cast<uint32_t>(i) * 65535u);
  }
  ASSERT_TRUE(testing::WriteBytes(path, file));
  const off_t size = off_t{dataStart} + off_t{format::kMaxDataRecords} * 65535;
  ASSERT_EQ(::truncate(path.c_str(), size), 0);

  int pipeFds[2];
  ASSERT_EQ(::pipe(pipeFds), 0);
  const pid_t child = ::fork();
  ASSERT_GE(child, 0);
  if (child == 0) {
    ::close(pipeFds[0]);
    if (kLimitAddressSpace) {
      rlimit limit{size_t{768} << 20, size_t{768} << 20};
      ::setrlimit(RLIMIT_AS, &limit);
    }
    std::string text;
    for (const char* command : {"security", "author", "order", "info"}) {
      Result r = Cli({command, path});
      text += std::string("[") + command + " " + std::to_string(r.code) + "]\n" + r.out + r.err;
    }
    ssize_t ignored = ::write(pipeFds[1], text.data(), text.size());
    (void)ignored;
    ::_exit(0);
  }
  ::close(pipeFds[1]);
  std::string text;
  char buffer[4096];
  for (ssize_t n; (n = ::read(pipeFds[0], buffer, sizeof buffer)) > 0;) text.append(buffer, n);
  ::close(pipeFds[0]);
  int status = 0;
  rusage usage{};
  ASSERT_EQ(::wait4(child, &status, 0, &usage), child);
  EXPECT_LT(usage.ru_maxrss, 768L * 1024) << "peak resident size in KiB";
  for (const char* command : {"security", "author", "order", "info"}) {
    EXPECT_NE(text.find(std::string("[") + command + " 0]"), std::string::npos) << text;
  }
  EXPECT_NE(text.find("Open Database: Full Access"), std::string::npos) << text;
  EXPECT_NE(text.find("Records:     65504"), std::string::npos) << text;
}

}  // namespace
}  // namespace cx::cli
