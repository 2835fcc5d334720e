#include <gtest/gtest.h>

#include <random>

#include "ops/compare.h"
#include "ops/database_settings.h"
#include "ops/position_sort.h"
#include "ops/sort.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Byte;
using testing::Num;
using testing::TestDb;
using testing::Text;
using testing::TimeVal;

// The whole-table sort written straight from its description: the record
// table itself put in order with CompareRecords, which walks both records'
// slots on every call. SortAll, which compares rows of prepared keys
// instead, must put the records in exactly this order.
void ReferenceSortAll(Database& db) {
  RecordTable& t = db.table();
  const long n = static_cast<long>(t.size());
  if (db.schema().sortKey[0].Field() == -1 || n < 2) return;
  SortPositions(
      n, [&](long x, long y) { return CompareRecords(db, t[x].bytes(), t[y].bytes()); },
      [&](long x, long y) { std::swap(t[x], t[y]); });
}

void SetKeys(Database& db, std::initializer_list<std::pair<int, int>> keys) {
  int k = 0;
  for (auto [field, direction] : keys) {
    db.schema().sortKey[k].field = static_cast<uint8_t>(static_cast<int8_t>(field));
    db.schema().sortKey[k].direction = static_cast<uint8_t>(direction);
    ++k;
  }
  for (; k < 3; ++k) db.schema().sortKey[k].field = 255;
}

// The record cut short before `slot`: it has no value slot for it or any
// later field, as a record written before those fields existed.
Bytes CutBefore(Bytes record, int slot) {
  const int at = FieldOffset(slot, record);
  if (at < 2) return record;
  record.resize(static_cast<size_t>(at - 2));
  record.push_back(0xFF);
  record.push_back(0xFF);
  return record;
}

class CompareTest : public ::testing::Test {
 protected:
  int Cmp(const Bytes& a, const Bytes& b, int field, int direction = 1) {
    return CompareByField(t.db, a, b, field, direction);
  }
  TestDb t;
};

TEST_F(CompareTest, MissingSlotComparesLowerWhateverTheDirection) {
  const int name = t.Field(FieldType::Text, "Name");
  const int qty = t.Field(FieldType::Integer, "Qty");
  Bytes full = t.Build({Text(name, "b"), Num(qty, 5)});
  Bytes cut = CutBefore(full, qty);
  for (int dir : {0, 1}) {
    EXPECT_LT(Cmp(cut, full, qty, dir), 0);
    EXPECT_GT(Cmp(full, cut, qty, dir), 0);
    EXPECT_LT(Cmp(cut, cut, qty, dir), 0) << "A is checked first";
  }
}

TEST_F(CompareTest, IntegerDifferenceWrapsAround) {
  const int qty = t.Field(FieldType::Integer, "Qty");
  Bytes big = t.Build({Num(qty, 2000000000u)});
  Bytes negative = t.Build({Num(qty, static_cast<uint32_t>(-2000000000))});
  Bytes small = t.Build({Num(qty, 5)});
  EXPECT_LT(Cmp(big, negative, qty), 0) << "the negative one compares larger";
  EXPECT_GT(Cmp(big, small, qty), 0);
  // Reverse swaps the operands rather than negating: for values exactly
  // 2^31 apart both orders give "less".
  Bytes zero = t.Build({Num(qty, 0)});
  Bytes lowest = t.Build({Num(qty, 0x80000000u)});
  EXPECT_LT(Cmp(zero, lowest, qty, 1), 0);
  EXPECT_LT(Cmp(zero, lowest, qty, 0), 0);
}

TEST_F(CompareTest, TextIgnoresCaseByLowerCasing) {
  const int name = t.Field(FieldType::Text, "Name");
  EXPECT_EQ(Cmp(t.Build({Text(name, "apple")}), t.Build({Text(name, "APPLE")}), name), 0);
  EXPECT_LT(Cmp(t.Build({Text(name, "Apple")}), t.Build({Text(name, "banana")}), name), 0);
  EXPECT_GT(Cmp(t.Build({Text(name, "Apple")}), t.Build({Text(name, "banana")}), name, 0), 0);
  // Letters fold to lower case, so "_" (0x5F) sorts before "a" (0x61).
  EXPECT_LT(Cmp(t.Build({Text(name, "_x")}), t.Build({Text(name, "AX")}), name), 0);
  EXPECT_LT(Cmp(t.Build({Text(name, "ab")}), t.Build({Text(name, "abc")}), name), 0);
}

TEST_F(CompareTest, FloatComparesNumbers) {
  const int price = t.Field(FieldType::Float, "Price");
  EXPECT_GT(Cmp(t.Build({Text(price, "10")}), t.Build({Text(price, "9.5")}), price), 0);
  EXPECT_EQ(Cmp(t.Build({Text(price, "1.50")}), t.Build({Text(price, "1.5")}), price), 0);
  EXPECT_LT(Cmp(t.Build({Text(price, "-3")}), t.Build({Text(price, "")}), price), 0);
}

TEST_F(CompareTest, PopupByIndexOrByTextWhenSortPopupsIsOn) {
  const int color = t.Field(FieldType::PopUp, "Color");
  t.db.popups()[color].items = {"red", "Blue"};
  Bytes red = t.Build({Byte(color, 0)});
  Bytes blue = t.Build({Byte(color, 1)});
  Bytes none = t.Build({Byte(color, 255)});
  EXPECT_LT(Cmp(red, blue, color), 0);
  EXPECT_GT(Cmp(none, blue, color), 0);
  SetSortPopups(t.db.schema(), color, true);
  EXPECT_GT(Cmp(red, blue, color), 0);
  EXPECT_LT(Cmp(none, red, color), 0) << "\"No Value\" sorts among the texts";
}

TEST_F(CompareTest, NoTimeIsLaterThanEveryTime) {
  const int at = t.Field(FieldType::Time, "At");
  Bytes late = t.Build({TimeVal(at, 23, 59, 59)});
  Bytes early = t.Build({TimeVal(at, 0, 0, 1)});
  Bytes noTime = t.Build({TimeVal(at, 255, 0, 0)});
  EXPECT_LT(Cmp(early, late, at), 0);
  EXPECT_GT(Cmp(noTime, late, at), 0);
  EXPECT_LT(Cmp(noTime, late, at, 0), 0);
}

TEST_F(CompareTest, LinkedEmptyValuesComeFirstForward) {
  const int owner = t.Field(FieldType::Linked, "Owner");
  Bytes shortValue = testing::RawRecord({Bytes(10, 0)});
  Bytes empty = testing::RawRecord({Bytes(3, 0)});
  Bytes anne = t.Build({Text(owner, "Anne")});
  Bytes bob = t.Build({Text(owner, "bob")});
  EXPECT_EQ(Cmp(shortValue, empty, owner), 0);
  EXPECT_LT(Cmp(shortValue, anne, owner), 0);
  EXPECT_GT(Cmp(shortValue, anne, owner, 0), 0);
  EXPECT_LT(Cmp(anne, bob, owner), 0);
}

TEST_F(CompareTest, CalculatedByResultFormat) {
  const int date = t.Calc("Due", 0, 3, 255, 255);
  const int dec = t.Calc("Sum", 0, 0, 255, 255);
  const int odd = t.Calc("Odd", 0, 9, 255, 255);
  Bytes a = t.Build({Text(date, "12abc"), Text(dec, "10.5"), Text(odd, "1")});
  Bytes b = t.Build({Text(date, "9.9"), Text(dec, "9.25"), Text(odd, "2")});
  EXPECT_GT(Cmp(a, b, date), 0) << "only the leading digits count";
  EXPECT_GT(Cmp(a, b, dec), 0);
  EXPECT_EQ(Cmp(a, b, odd), 0);
}

TEST_F(CompareTest, UnsortableTypesCompareEqual) {
  const int image = t.Field(FieldType::Image, "Photo");
  const int link = t.Field(FieldType::Link, "Parts");
  Bytes a = t.Build({Num(link, 1)});
  Bytes b = t.Build({Num(link, 7)});
  EXPECT_EQ(Cmp(a, b, image), 0);
  EXPECT_EQ(Cmp(a, b, link), 0);
}

TEST_F(CompareTest, RecordsStopAtTheFirstUnsetKey) {
  const int a = t.Field(FieldType::Integer, "A");
  const int b = t.Field(FieldType::Integer, "B");
  const int c = t.Field(FieldType::Integer, "C");
  Bytes r1 = t.Build({Num(a, 1), Num(b, 1), Num(c, 1)});
  Bytes r2 = t.Build({Num(a, 1), Num(b, 1), Num(c, 2)});
  SetKeys(t.db, {{a, 1}, {-1, 1}, {c, 1}});
  EXPECT_EQ(CompareRecords(t.db, r1, r2), 0) << "no secondary key: the tertiary is not consulted";
  EXPECT_LT(ComparePlacement(t.db, r1, r2), 0) << "placement skips unset keys";
  SetKeys(t.db, {{a, 1}, {b, 0}, {c, 0}});
  EXPECT_GT(CompareRecords(t.db, r1, r2), 0);
  EXPECT_EQ(CompareRecords(t.db, Bytes{}, r2), 0);
}

TEST(SortAllTest, SmallOrUnkeyedTablesAreLeftAlone) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  SortAll(t.db);
  t.Add({Num(qty, 5)});
  t.db.ClearChanged();
  SetKeys(t.db, {{qty, 1}});
  SortAll(t.db);
  EXPECT_FALSE(t.db.changed());
  t.Add({Num(qty, 1)});
  SetKeys(t.db, {{-1, 1}, {qty, 1}});
  t.db.ClearChanged();
  SortAll(t.db);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{0, 1}));
  EXPECT_FALSE(t.db.changed());
  SetKeys(t.db, {{qty, 1}});
  SortAll(t.db);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{1, 0}));
  EXPECT_TRUE(t.db.changed());
}

TEST(SortAllTest, NoTimeRecordsComeLastForwardAndFirstReverse) {
  TestDb t;
  const int at = t.Field(FieldType::Time, "At");
  t.Add({TimeVal(at, 255, 0, 0)});
  t.Add({TimeVal(at, 10, 0, 0)});
  t.Add({TimeVal(at, 8, 30, 0)});
  t.Add({TimeVal(at, 255, 0, 0)});
  t.Add({TimeVal(at, 9, 0, 0)});
  SetKeys(t.db, {{at, 1}});
  SortAll(t.db);
  EXPECT_EQ(t.NumberAt(3, at) >> 16, 255u);
  EXPECT_EQ(t.NumberAt(4, at) >> 16, 255u);
  EXPECT_EQ(t.NumberAt(0, at) >> 16, 8u);
  SetKeys(t.db, {{at, 0}});
  SortAll(t.db);
  EXPECT_EQ(t.NumberAt(0, at) >> 16, 255u);
  EXPECT_EQ(t.NumberAt(1, at) >> 16, 255u);
  EXPECT_EQ(t.NumberAt(4, at) >> 16, 8u);
}

// Random tables with many duplicates, values more than 2^31 apart, records
// missing the key's slot and all directions: the precomputed sort must
// leave every record exactly where the plain algorithm does.
TEST(SortAllTest, SameOrderAsThePlainAlgorithm) {
  std::mt19937 rng(20240611);
  const char* words[] = {"apple", "APPLE", "Banana", "cherry", "", "_under", "Zed", "zed", "äx"};
  const char* floats[] = {"1.5", "10", "-2", "", "abc", "1.50", "3e2", "nan"};
  for (int trial = 0; trial < 48; ++trial) {
    TestDb t;
    const int name = t.Field(FieldType::Text, "Name");
    const int qty = t.Field(FieldType::Integer, "Qty");
    const int price = t.Field(FieldType::Float, "Price");
    const int color = t.Field(FieldType::PopUp, "Color");
    const int at = t.Field(FieldType::Time, "At");
    const int owner = t.Field(FieldType::Linked, "Owner");
    const int total = t.Calc("Total", 0, trial % 2 ? 1 : 5, qty, price);
    const int done = t.Field(FieldType::CheckBox, "Done");
    t.db.popups()[color].items = {"red", "Green", "blue", "green"};
    if (trial % 3 == 0) SetSortPopups(t.db.schema(), color, true);
    const int fields[] = {name, qty, price, color, at, owner, total, done};
    // Every other trial has every key in every record and numbers close
    // together, as most files do: across 2^31 or across 0 on some.
    const bool complete = trial % 2 == 1;
    const uint32_t base = trial % 4 == 1 ? 0x7FFFFFFDu : (trial % 4 == 3 ? 0xFFFFFFFDu : 0);
    const int n = 500 + static_cast<int>(rng() % 1500);
    for (int i = 0; i < n; ++i) {
      const uint32_t q = !complete && rng() % 4 == 0 ? rng() : base + rng() % 7;
      Bytes r = t.Build({Text(name, words[rng() % 9]), Num(qty, q), Text(price, floats[rng() % 8]),
                         Byte(color, static_cast<uint8_t>(rng() % 5 == 0 ? 255 : rng() % 4)),
                         TimeVal(at, rng() % 6 == 0 ? 255 : rng() % 3, rng() % 2, 0),
                         Text(owner, words[rng() % 9]), Text(total, floats[rng() % 8]),
                         Byte(done, static_cast<uint8_t>(rng() % 2))});
      if (!complete && rng() % 10 == 0) r = CutBefore(r, static_cast<int>(rng() % 8));
      if (!complete && rng() % 40 == 0) r.clear();
      t.db.AppendRecord(r, 0, static_cast<uint32_t>(i));
    }
    SetKeys(t.db, {{fields[rng() % 8], static_cast<int>(rng() % 2)},
                   {trial % 5 == 0 ? -1 : fields[rng() % 8], static_cast<int>(rng() % 2)},
                   {fields[rng() % 8], static_cast<int>(rng() % 2)}});
    Database plain = t.db;
    ReferenceSortAll(plain);
    SortAll(t.db);
    std::vector<uint32_t> expected;
    for (const DataRecord& r : plain.table()) expected.push_back(r.uniqueID());
    ASSERT_EQ(t.Ids(), expected) << "trial " << trial;
  }
}

// Two keys of texts in a large table are ranked at the same time, and its
// rows read and sorted on two threads; the order must still be the plain
// algorithm's.
TEST(SortAllTest, TwoTextKeysOfALargeTableGiveThePlainOrder) {
  std::mt19937 rng(99);
  TestDb t;
  const int city = t.Field(FieldType::Text, "City");
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int name = t.Field(FieldType::Text, "Name");
  const int owner = t.Field(FieldType::Linked, "Owner");
  const char* cities[] = {"Oslo", "oslo", "Bergen", "", "Ålesund", "Tromsø", "bergen, west"};
  // Large enough to be read and sorted on two threads; names of many
  // lengths, so that texts share their first eight bytes.
  for (uint32_t i = 0; i < 20000; ++i) {
    const std::string who = std::string(1 + rng() % 12, static_cast<char>('a' + rng() % 26)) + (rng() % 2 ? "X" : "x");
    t.db.AppendRecord(t.Build({Text(city, cities[rng() % 7]), Num(qty, rng() % 50), Text(name, who),
                               Text(owner, rng() % 9 ? who : "")}),
                      0, i);
  }
  auto check = [&](std::array<int, 3> keys) {
    SetKeys(t.db, {{keys[0], 1}, {keys[1], 0}, {keys[2], 1}});
    Database plain = t.db;
    ReferenceSortAll(plain);
    SortAll(t.db);
    std::vector<uint32_t> expected;
    for (const DataRecord& r : plain.table()) expected.push_back(r.uniqueID());
    ASSERT_EQ(t.Ids(), expected);
  };
  check({city, name, qty});
  check({name, owner, city});
  // Records without some keys' slots: the rows are compared one by one.
  for (size_t i = 0; i < t.db.recordCount(); i += 97) {
    t.db.ReplaceRecord(i, CutBefore(Bytes(t.db.record(i).begin(), t.db.record(i).end()), qty));
  }
  check({city, qty, name});
}

TEST(SortAllTest, FullSizeTableEndsSorted) {
  TestDb t;
  const int name = t.Field(FieldType::Text, "Name");
  const int qty = t.Field(FieldType::Integer, "Qty");
  std::mt19937 rng(7);
  for (size_t i = 0; i < format::kMaxDataRecords; ++i) {
    t.Add({Text(name, std::string(1, static_cast<char>('a' + rng() % 26))), Num(qty, rng() % 100000)});
  }
  SetKeys(t.db, {{name, 1}, {qty, 0}});
  SortAll(t.db);
  for (size_t i = 1; i < t.db.recordCount(); ++i) {
    ASSERT_LE(CompareRecords(t.db, t.db.record(i - 1), t.db.record(i)), 0) << i;
  }
  // Sorting a sorted table, and its reverse, stays quick and correct.
  SetKeys(t.db, {{name, 0}, {qty, 1}});
  SortAll(t.db);
  SortAll(t.db);
  for (size_t i = 1; i < t.db.recordCount(); ++i) {
    ASSERT_LE(CompareRecords(t.db, t.db.record(i - 1), t.db.record(i)), 0) << i;
  }
}

// An adversary that fixes each value only when a comparison forces it,
// always so that the pivot looks as bad as possible: the arrangement it
// leaves behind drives a plain median-of-three quicksort to n² comparisons.
TEST(SortAllTest, AdversarialArrangementStaysWithinNLogN) {
  for (const long n : {1000L, 4096L, 10007L}) {
    const long gas = n;
    std::vector<long> value(static_cast<size_t>(n), gas);
    std::vector<long> item(static_cast<size_t>(n));
    for (long i = 0; i < n; ++i) item[static_cast<size_t>(i)] = i;
    long solid = 0, candidate = -1, comparisons = 0;
    auto compare = [&](long x, long y) {
      ++comparisons;
      long& a = value[static_cast<size_t>(item[static_cast<size_t>(x)])];
      long& b = value[static_cast<size_t>(item[static_cast<size_t>(y)])];
      if (a == gas && b == gas) {
        if (item[static_cast<size_t>(x)] == candidate) {
          a = solid++;
        } else {
          b = solid++;
        }
      }
      if (a == gas) {
        candidate = item[static_cast<size_t>(x)];
      } else if (b == gas) {
        candidate = item[static_cast<size_t>(y)];
      }
      return a < b ? -1 : (a > b ? 1 : 0);
    };
    auto swap = [&](long x, long y) { std::swap(item[static_cast<size_t>(x)], item[static_cast<size_t>(y)]); };
    SortPositions(n, compare, swap);
    long log2 = 0;
    while ((1L << log2) < n) ++log2;
    EXPECT_LT(comparisons, 6 * n * log2) << n << " items";
    for (long i = 1; i < n; ++i) {
      ASSERT_LE(value[static_cast<size_t>(item[static_cast<size_t>(i - 1)])],
                value[static_cast<size_t>(item[static_cast<size_t>(i)])])
          << "position " << i << " of " << n;
    }
  }
}

// Splitting the work after the first partition must not change a single
// position, even for a comparison that is not a strict order (wrapped
// differences of numbers far apart) and for ranges full of ties.
TEST(SortAllTest, TwoThreadsGiveTheSameOrderAsOne) {
  std::mt19937 rng(5);
  for (const long n : {2L, 3L, 4L, 5L, 100L, 20011L}) {
    for (int kind = 0; kind < 3; ++kind) {
      std::vector<uint32_t> values(static_cast<size_t>(n));
      for (auto& v : values) v = kind == 0 ? rng() : (kind == 1 ? rng() % 3 : rng() % 1000);
      // Where each item ends up, not only the values: ties must land alike.
      auto run = [&](auto sort) {
        std::vector<size_t> item(values.size());
        for (size_t i = 0; i < item.size(); ++i) item[i] = i;
        auto value = [&](long at) { return values[item[static_cast<size_t>(at)]]; };
        sort(n, [&](long x, long y) { return static_cast<int>(static_cast<int32_t>(value(x) - value(y))); },
             [&](long x, long y) { std::swap(item[static_cast<size_t>(x)], item[static_cast<size_t>(y)]); });
        return item;
      };
      auto one = run([](long count, auto compare, auto swap) { SortPositions(count, compare, swap); });
      auto two = run([](long count, auto compare, auto swap) { SortPositionsOnTwoThreads(count, compare, swap); });
      ASSERT_EQ(one, two) << n << " items, kind " << kind;
    }
  }
}

TEST(PlacementTest, RepositionMovesAfterEqualRecords) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  for (uint32_t q : {1, 3, 3, 5, 7}) t.Add({Num(qty, q)});
  SetKeys(t.db, {{qty, 1}});
  // Record 0 becomes 3: it goes after both 3s, before the 5.
  t.db.ReplaceRecord(0, t.Build({Num(qty, 3)}));
  EXPECT_EQ(RepositionRecord(t.db, 0), 2u);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{1, 2, 0, 3, 4}));
  // The last record becomes 0: it moves to the front.
  t.db.ReplaceRecord(4, t.Build({Num(qty, 0)}));
  EXPECT_EQ(RepositionRecord(t.db, 4), 0u);
  // A record larger than all goes to the end.
  t.db.ReplaceRecord(1, t.Build({Num(qty, 99)}));
  EXPECT_EQ(RepositionRecord(t.db, 1), 4u);
  EXPECT_EQ(t.NumberAt(4, qty), 99u);
  // Without keys nothing moves.
  SetKeys(t.db, {});
  t.db.ReplaceRecord(4, t.Build({Num(qty, 0)}));
  EXPECT_EQ(RepositionRecord(t.db, 4), 4u);
}

TEST(PlacementTest, UnsetPrimaryKeyIsSkippedWhenPlacing) {
  TestDb t;
  const int a = t.Field(FieldType::Integer, "A");
  const int b = t.Field(FieldType::Text, "B");
  t.Add({Num(a, 1), Text(b, "a")});
  t.Add({Num(a, 1), Text(b, "c")});
  SetKeys(t.db, {{-1, 1}, {b, 1}});
  t.db.AppendRecord(t.Build({Num(a, 1), Text(b, "B")}), 0, 9);
  EXPECT_EQ(InsertionPlace(t.db, 2), 1u);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{0, 9, 1}));
}

TEST(PlacementTest, InsertionPlaceInEmptyTableIsZero) {
  TestDb t;
  const int a = t.Field(FieldType::Integer, "A");
  SetKeys(t.db, {{a, 1}});
  t.Add({Num(a, 4)});
  EXPECT_EQ(InsertionPlace(t.db, 0), 0u);
  t.Add({Num(a, 9)});
  EXPECT_EQ(InsertionPlace(t.db, 1), 1u);
  t.Add({Num(a, 5)});
  EXPECT_EQ(InsertionPlace(t.db, 2), 1u);
}

TEST(CheckSortableTest, MessagesNameTheField) {
  TestDb t;
  const int text = t.Field(FieldType::Text, "Name");
  const int image = t.Field(FieldType::Image, "Photo");
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int running = t.Calc("Running", 0, 0, qty, qty, 2);
  const int viaOther = t.Calc("Via", 0, 0, running, 255);
  const int plain = t.Calc("Plain", 0, 0, qty, 255);
  const int loop = t.Calc("Loop", 0, 0, 0, 255);
  t.db.schema().field[loop].param1 = static_cast<uint8_t>(loop);

  EXPECT_EQ(CheckSortable(t.db, -1, &t.ui), 1);
  EXPECT_EQ(CheckSortable(t.db, text, &t.ui), 1);
  EXPECT_EQ(CheckSortable(t.db, plain, &t.ui), 1);
  EXPECT_EQ(CheckSortable(t.db, loop, &t.ui), 1);
  EXPECT_TRUE(t.ui.messages.empty());

  EXPECT_EQ(CheckSortable(t.db, image, &t.ui), 0);
  EXPECT_EQ(CheckSortable(t.db, 29, &t.ui), 0);
  EXPECT_EQ(CheckSortable(t.db, viaOther, &t.ui), 0);
  EXPECT_EQ(CheckSortable(t.db, running, nullptr), 0);
  ASSERT_EQ(t.ui.messages.size(), 3u);
  EXPECT_EQ(t.ui.messages[0].text, "This type of field (Photo) cannot currently be sorted!\n");
  EXPECT_EQ(t.ui.messages[0].caption, "ERROR!");
  EXPECT_EQ(t.ui.messages[1].text, "This type of field (Field 30) cannot currently be sorted!\n");
  EXPECT_EQ(t.ui.messages[2].text,
            "Since this field (Via) references other records, it's value is relative to it's "
            "position, meaning that it cannot be the basis for a sort!\n");
}

TEST(SortingDialogTest, TertiaryDirectionFollowsThePrimary) {
  TestDb t;
  const int a = t.Field(FieldType::Integer, "A");
  const int b = t.Field(FieldType::Text, "B");
  const int c = t.Field(FieldType::Float, "C");
  SortingChoice choice = OpenSortingDialog(t.db.schema());
  EXPECT_EQ(choice.entry, (std::array<int, 3>{0, 0, 0}));
  choice.entry = {a + 1, b + 1, c + 1};
  choice.forward = {true, false, false};
  ASSERT_TRUE(AcceptSortingDialog(t.db, choice, t.ui));
  const auto& keys = t.db.schema().sortKey;
  EXPECT_EQ(keys[0].Field(), a);
  EXPECT_EQ(keys[1].Field(), b);
  EXPECT_EQ(keys[2].Field(), c);
  EXPECT_EQ(keys[0].direction, 1);
  EXPECT_EQ(keys[1].direction, 0);
  EXPECT_EQ(keys[2].direction, 1) << "Reverse on the tertiary pair is not stored";
  EXPECT_TRUE(t.db.changed());

  choice = OpenSortingDialog(t.db.schema());
  EXPECT_EQ(choice.entry, (std::array<int, 3>{a + 1, b + 1, c + 1}));
  EXPECT_EQ(choice.forward, (std::array<bool, 3>{true, false, true}));
}

TEST(SortingDialogTest, UnsortableChoiceKeepsTheDialogOpen) {
  TestDb t;
  const int a = t.Field(FieldType::Integer, "A");
  const int photo = t.Field(FieldType::Image, "Photo");
  const Schema before = t.db.schema();
  SortingChoice choice;
  choice.entry = {a + 1, photo + 1, 0};
  choice.forward = {true, true, true};
  EXPECT_FALSE(AcceptSortingDialog(t.db, choice, t.ui));
  EXPECT_EQ(t.db.schema(), before);
  EXPECT_FALSE(t.db.changed());
  ASSERT_EQ(t.ui.messages.size(), 1u);
  EXPECT_EQ(t.ui.messages[0].text, "This type of field (Photo) cannot currently be sorted!\n");
}

TEST(SortingDialogTest, HeaderSortSetsOneKeyWithoutChecking) {
  TestDb t;
  const int a = t.Field(FieldType::Integer, "A");
  const int photo = t.Field(FieldType::Image, "Photo");
  for (uint32_t v : {2, 9, 4}) t.Add({Num(a, v)});
  SetKeys(t.db, {{photo, 1}, {a, 1}, {a, 1}});
  t.db.ClearChanged();
  SortFromHeader(t.session, a, false);
  EXPECT_EQ(t.db.schema().sortKey[0].Field(), a);
  EXPECT_EQ(t.db.schema().sortKey[0].direction, 0);
  EXPECT_EQ(t.db.schema().sortKey[1].Field(), -1);
  EXPECT_EQ(t.db.schema().sortKey[2].Field(), -1);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{1, 2, 0}));
  EXPECT_EQ(t.session.view, (std::vector<uint32_t>{0, 1, 2}));
  EXPECT_TRUE(t.db.changed());
  SortFromHeader(t.session, photo, true);
  EXPECT_TRUE(t.ui.messages.empty());
}

TEST(SortKeyTextTest, SlotsNamesAndDirections) {
  TestDb t;
  t.Field(FieldType::Integer, "Qty");
  const int name = t.Field(FieldType::Text, "Last Name");
  int field = -2;
  bool forward = false;
  std::string error;
  ASSERT_TRUE(ParseSortKeyText(t.db.schema(), "12", field, forward, error));
  EXPECT_EQ(field, 12);
  EXPECT_TRUE(forward);
  ASSERT_TRUE(ParseSortKeyText(t.db.schema(), "last name:reverse", field, forward, error));
  EXPECT_EQ(field, name);
  EXPECT_FALSE(forward);
  EXPECT_FALSE(ParseSortKeyText(t.db.schema(), "Nope", field, forward, error));
  EXPECT_FALSE(error.empty());
}

}  // namespace
}  // namespace cx
