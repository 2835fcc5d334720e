// On generated databases of every field type, at a handful of records and
// at the format's maximum, the sorted order, the view and the find hits
// agree with the comparison, filter and match rules taken one at a time.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "bench/generator.h"
#include "ops/compare.h"
#include "ops/database_settings.h"
#include "ops/find.h"
#include "ops/session.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using bench::GeneratorOptions;

Database Generate(size_t records, uint32_t seed) {
  GeneratorOptions options;
  options.records = records;
  options.seed = seed;
  options.maxNoteLength = 40;
  return bench::GenerateDatabase("random.PDB", options);
}

std::vector<Bytes> Contents(const Database& db) {
  std::vector<Bytes> all;
  for (size_t i = 0; i < db.recordCount(); ++i) all.emplace_back(db.record(i).begin(), db.record(i).end());
  std::sort(all.begin(), all.end());
  return all;
}

void CheckSorted(Database& db, std::mt19937& rng) {
  const int sortable[] = {bench::kName, bench::kQuantity, bench::kPrice, bench::kColor, bench::kPaid,
                          bench::kBorn, bench::kAt, bench::kCity, bench::kRating, bench::kTotal};
  for (auto& key : db.schema().sortKey) {
    key.field = static_cast<uint8_t>(sortable[rng() % std::size(sortable)]);
    key.direction = rng() % 2;
  }
  const std::vector<Bytes> before = Contents(db);
  SortAll(db);
  for (size_t i = 1; i < db.recordCount(); ++i) {
    ASSERT_LE(CompareRecords(db, db.record(i - 1), db.record(i)), 0) << "records " << i - 1 << ", " << i;
  }
  EXPECT_EQ(Contents(db), before);  // the same records, only moved
}

FilterSettings RandomFilters(std::mt19937& rng) {
  FilterSettings f;
  for (int n = 0; n < 2; ++n) {
    Filter& filter = f.filter[n];
    filter.enabled = rng() % 4 != 0;
    switch (rng() % 4) {
      case 0:
        filter.field = bench::kName;
        filter.SetLowerText(std::string(1, static_cast<char>('a' + rng() % 26)));
        break;
      case 1:
        filter.field = bench::kQuantity;
        filter.lowerNumber = static_cast<int32_t>(rng() % 500);
        filter.upperNumber = filter.lowerNumber + static_cast<int32_t>(rng() % 20000);
        break;
      case 2:
        filter.field = bench::kBorn;
        filter.SetLowerDay(static_cast<uint32_t>(20000 + rng() % 20000));
        filter.SetUpperDay(filter.LowerDay() + static_cast<uint32_t>(rng() % 10000));
        break;
      default:
        filter.field = bench::kPaid;
        filter.lowerNumber = static_cast<int32_t>(rng() % 2);
        break;
    }
  }
  f.combination = static_cast<uint8_t>(rng() % 8);
  return f;
}

// The view test spelt out from its rules, one filter at a time.
bool InViewByRules(const Database& db, const FilterSettings& f, size_t index) {
  ByteView record = db.record(index);
  if (!f.AnyEnabled()) return true;
  std::optional<bool> result;
  if (f.filter[0].enabled) result = (FilterTest(db, 1, record) != 0) != f.Not(0);
  if (f.filter[1].enabled) {
    if (result && f.UsesOr() && *result) return true;
    if (result && !f.UsesOr() && !*result) return false;
    result = (FilterTest(db, 2, record) != 0) != f.Not(1);
  }
  return *result;
}

void CheckViewAndFind(Database& db, std::mt19937& rng) {
  const FilterSettings filters = RandomFilters(rng);
  StoreFilterSettings(filters, db.schema());
  std::vector<uint32_t> expected;
  for (size_t i = 0; i < db.recordCount(); ++i) {
    if (InViewByRules(db, filters, i)) expected.push_back(static_cast<uint32_t>(i));
  }
  ASSERT_EQ(RebuildView(db), expected);

  // Every record in view with a match in any field, each once, in order.
  testing::ScriptedUi ui;
  LocaleInfo locale;
  DataSession session(db, locale, ui);
  session.view = expected;
  SearchSettings search;
  search.text = std::string(1, static_cast<char>('a' + rng() % 26)) + static_cast<char>('a' + rng() % 26);
  std::vector<int> matching;
  for (uint32_t i : expected) {
    for (int field = 0; field < format::kFieldCount; ++field) {
      if (FieldMatches(db, db.record(i), field, search.text, false, false, locale)) {
        matching.push_back(static_cast<int>(i));
        break;
      }
    }
  }
  // Each search starts after the previous hit, and a start at the last
  // record finds nothing.
  std::vector<int> wanted;
  const int last = static_cast<int>(db.recordCount()) - 1;
  for (int start = 0, k = 0; start < last && k < static_cast<int>(matching.size()); ++k) {
    if (matching[k] < start) continue;
    wanted.push_back(matching[k]);
    start = matching[k] + 1;
  }
  std::vector<int> hits;
  for (int hit = SearchDatabase(session, search); hit >= 0 && hits.size() <= db.recordCount();
       hit = RepeatFind(session)) {
    hits.push_back(hit);
  }
  EXPECT_EQ(hits, wanted) << "needle " << search.text;
}

TEST(RandomAgreementTest, SmallDatabases) {
  for (uint32_t seed = 1; seed <= 40; ++seed) {
    SCOPED_TRACE(seed);
    std::mt19937 rng(seed);
    Database db = Generate(10, seed);
    CheckSorted(db, rng);
    CheckViewAndFind(db, rng);
  }
}

TEST(RandomAgreementTest, FullSizeDatabase) {
  for (uint32_t seed = 1; seed <= 2; ++seed) {
    SCOPED_TRACE(seed);
    std::mt19937 rng(seed * 7919);
    Database db = Generate(format::kMaxDataRecords, seed);
    CheckSorted(db, rng);
    CheckViewAndFind(db, rng);
  }
}

}  // namespace
}  // namespace cx
