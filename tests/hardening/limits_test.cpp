// Databases at the format's limits: the most records a file can hold, the
// largest records, every popup list full, every field a full Note. Opening,
// sorting, exporting and saving them must work, and within memory
// proportional to the file. Each case is built in one child process and
// measured in another, so that nothing else this test did counts.
#include <gtest/gtest.h>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <functional>
#include <random>
#include <string>

#include "bench/generator.h"
#include "engine/byte_order.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "engine/value_text.h"
#include "ops/compare.h"
#include "ops/csv_export.h"
#include "ops/sort.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "platform/locale_info.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

#if defined(__SANITIZE_ADDRESS__)
constexpr bool kMeasureMemory = false;  // the sanitizer's own memory swamps the figures
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
constexpr bool kMeasureMemory = false;
#else
constexpr bool kMeasureMemory = true;
#endif
#else
constexpr bool kMeasureMemory = true;
#endif

const FixedClock kClock(1700000000);

// Peak memory allowed for open + sort + export + save: a few copies of the
// file (its image, the sorted table, the new file's buffers) and a fixed
// allowance for the program itself.
constexpr double kCopiesOfFile = 4.0;
constexpr long kFixedAllowanceKb = 24 * 1024;

long ResidentKb() {
  long pages = 0, resident = 0;
  if (FILE* f = std::fopen("/proc/self/statm", "r")) {
    if (std::fscanf(f, "%ld %ld", &pages, &resident) != 2) resident = 0;
    std::fclose(f);
  }
  return resident * (::sysconf(_SC_PAGESIZE) / 1024);
}

struct ChildResult {
  char error[512] = {};
  long growthKb = 0;
};

// Runs `work` in a child process; its error text ("" when all went well)
// and how far its peak resident memory rose above where it started.
ChildResult InChild(const std::function<std::string()>& work) {
  ChildResult result;
  int fds[2];
  if (::pipe(fds) != 0) {
    std::snprintf(result.error, sizeof result.error, "pipe failed");
    return result;
  }
  pid_t pid = ::fork();
  if (pid == 0) {
    ::close(fds[0]);
    ChildResult r;
    const long before = ResidentKb();
    std::string error = work();
    rusage usage{};
    ::getrusage(RUSAGE_SELF, &usage);
    r.growthKb = usage.ru_maxrss - before;
    std::snprintf(r.error, sizeof r.error, "%s", error.c_str());
    ssize_t ignored = ::write(fds[1], &r, sizeof r);
    (void)ignored;
    ::_exit(0);
  }
  ::close(fds[1]);
  if (pid < 0 || ::read(fds[0], &result, sizeof result) != sizeof result) {
    std::snprintf(result.error, sizeof result.error, "the child process failed");
  }
  ::close(fds[0]);
  if (pid > 0) ::waitpid(pid, nullptr, 0);
  return result;
}

// Builds the file with `build` in one child, then opens, sorts on the
// schema's keys, exports and saves it in another and checks the memory.
void RunAtLimit(const std::string& path, const std::function<std::string()>& build,
                size_t expectedRecords) {
  ChildResult built = InChild(build);
  ASSERT_STREQ(built.error, "");
  const int64_t fileSize = FileSize(path);
  ASSERT_GT(fileSize, 0);

  ChildResult used = InChild([&]() -> std::string {
    SilentUi ui;
    Database db;
    if (Status s = db.Open(path, ui); !s) return "open: " + s.message();
    if (db.partial() || db.malformedRecords() != 0) return "open: read in part";
    if (db.recordCount() != expectedRecords) return "open: " + std::to_string(db.recordCount()) + " records";
    SortAll(db);
    for (size_t i = 1; i < db.recordCount(); ++i) {
      if (CompareRecords(db, db.record(i - 1), db.record(i)) > 0) return "sort: out of order at " + std::to_string(i);
    }
    LocaleInfo locale;
    CsvExportOptions options;
    options.withHeader = true;
    if (ExportCsv(db, options, path + ".csv", CsvSettings{}, locale, ui) != 1) return "export failed";
    if (FileSize(path + ".csv") <= 0) return "export: empty file";
    if (Status s = db.SaveAs(path + ".saved", kClock); !s) return "save: " + s.message();
    Database again;
    if (!again.Open(path + ".saved", ui) || again.recordCount() != expectedRecords) return "reopen failed";
    return "";
  });
  EXPECT_STREQ(used.error, "");
  const long allowedKb = static_cast<long>(kCopiesOfFile * fileSize / 1024) + kFixedAllowanceKb;
  std::printf("file %lld KB, peak growth %ld KB (allowed %ld KB)\n",
              static_cast<long long>(fileSize / 1024), used.growthKb, allowedKb);
  if (kMeasureMemory) {
    EXPECT_LE(used.growthKb, allowedKb);
  }
  RemoveFile(path + ".csv");
  RemoveFile(path + ".saved");
}

std::string SaveNew(Database& db) {
  Status s = db.SaveAs(db.path(), kClock);
  return s ? "" : s.message();
}

class LimitsTest : public ::testing::Test {
 protected:
  testing::TempDir dir;
};

TEST_F(LimitsTest, MostRecordsAFileCanHold) {
  const std::string path = dir.File("Full.PDB");
  RunAtLimit(path, [&] {
    bench::GeneratorOptions options;
    options.records = format::kMaxDataRecords;
    options.maxNoteLength = 40;
    Database db = bench::GenerateDatabase(path, options);
    db.schema().sortKey[0] = {bench::kCity, 1};
    db.schema().sortKey[1] = {bench::kBorn, 0};
    db.schema().sortKey[2] = {bench::kName, 1};
    if (db.CanAddRecord()) return std::string("room for one more");
    return SaveNew(db);
  }, format::kMaxDataRecords);
}

TEST_F(LimitsTest, RecordsOfTheLargestSize) {
  const std::string path = dir.File("Large.PDB");
  constexpr size_t kRecords = 120;
  RunAtLimit(path, [&] {
    Database db = Database::CreateNew(path, "Large");
    db.schema().field[0].typeNumber = static_cast<int16_t>(FieldType::Note);
    db.schema().sortKey[0] = {0, 1};
    std::mt19937 rng(5);
    for (size_t r = 0; r < kRecords; ++r) {
      // Only another program writes a Note this long: prefix, length, text.
      Bytes record(format::kMaxRecordSize - 1, 0);
      const size_t text = record.size() - 1 - 2 - 1;
      PutLE16(record.data() + 1, static_cast<uint16_t>(text + 1));
      for (size_t i = 0; i < text; ++i) record[3 + i] = static_cast<uint8_t>('a' + rng() % 26);
      db.AppendRecord(std::move(record));
    }
    return SaveNew(db);
  }, kRecords);
}

TEST_F(LimitsTest, EveryPopupListFull) {
  const std::string path = dir.File("Popups.PDB");
  constexpr size_t kRecords = 3000;
  RunAtLimit(path, [&] {
    Database db = Database::CreateNew(path, "Popups");
    Schema& s = db.schema();
    for (int f = 0; f < format::kFieldCount; ++f) {
      s.field[f].typeNumber = static_cast<int16_t>(FieldType::PopUp);
      std::vector<std::string>& items = db.popups()[f].items;
      for (int i = 0; i < format::kMaxPopupItems; ++i) {
        std::string item(format::kMaxPopupText, static_cast<char>('A' + (i * 7 + f) % 26));
        item.replace(0, 6, std::to_string(100000 + f * 100 + i));
        items.push_back(item);
      }
    }
    s.sortKey[0] = {3, 1};
    s.sortKey[1] = {17, 0};
    s.sortKey[2] = {29, 1};
    std::mt19937 rng(9);
    for (size_t r = 0; r < kRecords; ++r) {
      Bytes e = NewEditingRecord(s);
      for (int f = 0; f < format::kFieldCount; ++f) {
        SetEditingByte(e, f, static_cast<uint8_t>(rng() % format::kMaxPopupItems), s);
      }
      db.AppendRecord(Compact(e, s));
    }
    return SaveNew(db);
  }, kRecords);

  // Every entry survives whole and shows whole.
  SilentUi ui;
  Database db;
  ASSERT_TRUE(db.Open(path, ui).ok());
  LocaleInfo locale;
  ValueContext ctx{db.schema(), db.popups(), locale};
  for (int f = 0; f < format::kFieldCount; ++f) {
    ASSERT_EQ(db.popups()[f].items.size(), size_t(format::kMaxPopupItems));
    EXPECT_EQ(ValueText(ctx, db.record(0), f).size(), format::kMaxPopupText);
  }
}

TEST_F(LimitsTest, EveryFieldAFullNote) {
  const std::string path = dir.File("Notes.PDB");
  constexpr size_t kRecords = 250;
  constexpr size_t kNote = 1999;  // the editing slot's 2000 bytes less the NUL
  RunAtLimit(path, [&] {
    Database db = Database::CreateNew(path, "Notes");
    Schema& s = db.schema();
    for (int f = 0; f < format::kFieldCount; ++f) s.field[f].typeNumber = static_cast<int16_t>(FieldType::Note);
    s.sortKey[0] = {29, 1};
    s.sortKey[1] = {0, 0};
    s.sortKey[2] = {15, 1};
    std::mt19937 rng(3);
    for (size_t r = 0; r < kRecords; ++r) {
      Bytes e = NewEditingRecord(s);
      for (int f = 0; f < format::kFieldCount; ++f) {
        std::string text(kNote, ' ');
        for (size_t i = 0; i < 8; ++i) text[i] = static_cast<char>('a' + rng() % 26);
        SetEditingText(e, f, text, s);
      }
      Bytes stored = Compact(e, s);
      if (stored.size() != 1 + format::kFieldCount * (2 + kNote + 1)) return std::string("unexpected record size");
      db.AppendRecord(std::move(stored));
    }
    return SaveNew(db);
  }, kRecords);
}

// Header counts that the file cannot back: refused or read as far as the
// file goes, without taking memory for what is only claimed.
TEST_F(LimitsTest, CountsTheFileCannotBack) {
  const std::string path = dir.File("Claims.PDB");
  bench::GeneratorOptions options;
  options.records = 3;
  ASSERT_TRUE(bench::GenerateFile(path, options, kClock).ok());
  Bytes file;
  ASSERT_TRUE(ReadWholeFile(path, file));

  // The entry list for 65535 records does not fit: refused.
  Bytes claim = file;
  claim[76] = 0xFF;
  claim[77] = 0xFF;
  ASSERT_TRUE(WriteFileSafely(path, claim.data(), claim.size()).ok());
  ChildResult refused = InChild([&]() -> std::string {
    SilentUi ui;
    Database db;
    Status s = db.Open(path, ui);
    return s ? "opened" : (s.message() == "Could not initialize file" ? "" : s.message());
  });
  EXPECT_STREQ(refused.error, "");
  if (kMeasureMemory) {
    EXPECT_LT(refused.growthKb, 4096);
  }

  // 65535 entries that all point past the end of the file: refused at the
  // schema record, again without memory for what is claimed.
  Bytes entries(78 + 8 * format::kMaxFileRecords + 42, 0);
  std::copy(file.begin(), file.begin() + 78, entries.begin());
  entries[76] = 0xFF;
  entries[77] = 0xFF;
  for (size_t i = 0; i < format::kMaxFileRecords; ++i) PutBE32(entries.data() + 78 + 8 * i, 0x7FFFFFF0u);
  ASSERT_TRUE(WriteFileSafely(path, entries.data(), entries.size()).ok());
  ChildResult partial = InChild([&]() -> std::string {
    SilentUi ui;
    Database db;
    Status s = db.Open(path, ui);
    if (s) return "opened";
    return s.message() == "Could not read file" ? "" : s.message();
  });
  EXPECT_STREQ(partial.error, "");
  if (kMeasureMemory) {
    EXPECT_LT(partial.growthKb, 8192);
  }

  // A record over 65535 bytes is more than a record may hold: the records
  // before it are read, and saving over the file is refused.
  Database big = Database::CreateNew(path, "Big");
  big.AppendRecord(Bytes{0, 0xFF, 0xFF});
  big.AppendRecord(Bytes(format::kMaxRecordSize + 1, 0));
  big.AppendRecord(Bytes{0, 0xFF, 0xFF});
  ASSERT_TRUE(big.SaveAs(path, kClock).ok());
  SilentUi ui;
  Database db;
  ASSERT_TRUE(db.Open(path, ui).ok());
  EXPECT_TRUE(db.partial());
  EXPECT_EQ(db.recordCount(), 1u);
  EXPECT_FALSE(db.Save(kClock).ok());
}

}  // namespace
}  // namespace cx
