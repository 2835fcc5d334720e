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

}  // namespace
}  // namespace cx::fuzz
