// Replays every fuzz corpus input and every input that once made a target
// fail, so that each build (g++, the sanitizer build) checks them again.
// A broken property aborts the run; the last "replaying" line names the
// input.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "engine/record.h"
#include "engine/record_store.h"
#include "fuzz/targets.h"
#include "ops/compare.h"
#include "ops/sort.h"
#include "platform/clock.h"
#include "tests/support/test_support.h"

namespace cx::fuzz {
namespace {

namespace fs = std::filesystem;

std::vector<fs::path> InputsOf(const std::string& folder) {
  std::vector<fs::path> files;
  std::error_code ec;
  for (const auto& e : fs::directory_iterator(folder, ec)) {
    if (e.is_regular_file() && e.path().filename().string()[0] != '.') files.push_back(e.path());
  }
  std::sort(files.begin(), files.end());
  return files;
}

size_t Replay(const Target& target, const std::string& folder) {
  size_t count = 0;
  for (const fs::path& file : InputsOf(folder)) {
    std::ifstream in(file, std::ios::binary);
    std::vector<uint8_t> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    std::fprintf(stderr, "replaying %s\n", file.c_str());
    EXPECT_EQ(target.run(bytes.data(), bytes.size()), 0) << file;
    ++count;
  }
  return count;
}

class FuzzReplay : public ::testing::TestWithParam<Target> {};

TEST_P(FuzzReplay, CorpusAndRegressionsPass) {
  const Target& target = GetParam();
  const std::string base = CARDOVEX_FUZZ_DIR;
  size_t corpus = Replay(target, base + "/corpus/" + std::string(target.name));
  Replay(target, base + "/regressions/" + std::string(target.name));
  EXPECT_GT(corpus, 0u) << "no corpus for " << target.name;
}

INSTANTIATE_TEST_SUITE_P(Targets, FuzzReplay, ::testing::ValuesIn(kTargets),
                         [](const auto& info) { return std::string(info.param.name); });

// The findings again, as plain tests of what went wrong.

// Sorting ranked texts by their first eight characters and only looked
// further when both were longer, so "Anderson" and "Andersons" tied.
TEST(FuzzFindings, TextsSharingTheirFirstEightCharactersSort) {
  for (uint8_t direction : {1, 0}) {
    Database db = Database::CreateNew("unused.PDB", "Sort");
    Schema& s = db.schema();
    s.field[0].typeNumber = static_cast<int16_t>(FieldType::Text);
    s.sortKey[0] = {0, direction};
    for (const char* name : {"Andersons", "anderson", "Andersen", "ANDERSONS2", "Anderso"}) {
      Bytes e = NewEditingRecord(s);
      SetEditingText(e, 0, name, s);
      db.AppendRecord(Compact(e, s));
    }
    SortAll(db);
    for (size_t i = 1; i < db.recordCount(); ++i) {
      EXPECT_LT(CompareRecords(db, db.record(i - 1), db.record(i)), 0) << "direction " << int(direction);
    }
  }
}

// A file's last record may hold 65535 bytes; sorting can move it up, and
// the file saved then must still read back whole.
TEST(FuzzFindings, LargestLastRecordStillReadsBackAfterSorting) {
  cx::testing::TempDir dir;
  SilentUi ui;
  Database db = Database::CreateNew(dir.File("Big.PDB"), "Big");
  db.schema().field[0].typeNumber = static_cast<int16_t>(FieldType::Text);
  for (auto [text, size] : {std::pair{"b", size_t{10}}, std::pair{"a", format::kMaxRecordSize}}) {
    Bytes r(size, 'x');
    r[0] = 0;
    r[1] = 2;
    r[2] = 0;
    r[3] = static_cast<uint8_t>(text[0]);
    r[4] = 0;
    db.AppendRecord(std::move(r));
  }
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  Database opened;
  ASSERT_TRUE(opened.Open(db.path(), ui).ok());
  ASSERT_EQ(opened.recordCount(), 2u);
  opened.schema().sortKey[0] = {0, 1};
  SortAll(opened);
  const std::string sorted = dir.File("Sorted.PDB");
  if (!opened.SaveAs(sorted, FixedClock(1)).ok()) return;  // refusing is fine
  Database again;
  ASSERT_TRUE(again.Open(sorted, ui).ok());
  EXPECT_FALSE(again.partial());
  EXPECT_EQ(again.recordCount(), 2u);
}

}  // namespace
}  // namespace cx::fuzz
