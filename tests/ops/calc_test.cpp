#include <gtest/gtest.h>

#include <cmath>
#include <random>

#include "ops/calc.h"
#include "ops/database_settings.h"
#include "ops/field_values.h"
#include "ops/open_database.h"
#include "ops/sort.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Byte;
using testing::Num;
using testing::TestDb;
using testing::Text;
using testing::TimeVal;

enum Op { kAdd, kSub, kMul, kDiv, kMin, kMax, kAvg };
enum Format { k4Places, kInteger, kTime, kDate, k3Places, k2Places, k1Place };
constexpr int kConst = 255;

void SortOn(Database& db, int field) {
  db.schema().sortKey[0].field = static_cast<uint8_t>(field);
  db.schema().sortKey[0].direction = 1;
}

TEST(CalcResultTest, OperationsAndFormats) {
  LocaleInfo us;
  EXPECT_EQ(CalcResultText(ApplyOperation(kDiv, 7, 0), k4Places, us), "0.0000");
  EXPECT_EQ(CalcResultText(ApplyOperation(kDiv, 7, 0), kInteger, us), "0");
  EXPECT_EQ(CalcResultText(ApplyOperation(kAvg, 1, 2), k1Place, us), "1.5");
  EXPECT_EQ(CalcResultText(ApplyOperation(kSub, 1, 3.25), k2Places, us), "-2.25");
  EXPECT_EQ(CalcResultText(ApplyOperation(kMul, 1.5, 3), k3Places, us), "4.500");
  EXPECT_EQ(CalcResultText(ApplyOperation(kMax, 2, 9), kTime, us), "9");
  EXPECT_EQ(CalcResultText(2.5, kDate, us), "2");
  EXPECT_EQ(ApplyOperation(99, 1, 2), 0.0);
  // On a tie Min and Max keep the first operand, which shows with zeros
  // of different sign.
  EXPECT_EQ(CalcResultText(ApplyOperation(kMin, -0.0, 0.0), k4Places, us), "-0.0000");
  EXPECT_EQ(CalcResultText(ApplyOperation(kMin, 0.0, -0.0), k4Places, us), "0.0000");
  EXPECT_EQ(CalcResultText(ApplyOperation(kMax, -0.0, 0.0), k4Places, us), "-0.0000");
  // A result never holds more than the 14 characters of the slot.
  EXPECT_EQ(CalcResultText(123456789012.0, k4Places, us), "123456789012.0");
  LocaleInfo comma;
  comma.decimalSeparator = ',';
  EXPECT_EQ(CalcResultText(2.5, k4Places, comma), "2,5000");
}

TEST(CalcOperandTest, TextWithoutANumberIsPositiveZero) {
  for (const char* text : {"-\"9 a", "-abc", "-", " -.", "+x", ""}) {
    const double value = ParseDouble(text);
    EXPECT_EQ(value, 0.0) << text;
    EXPECT_FALSE(std::signbit(value)) << text;
  }
  // A zero that was read keeps its sign, as the C library's does.
  EXPECT_TRUE(std::signbit(ParseDouble("-0")));
  EXPECT_TRUE(std::signbit(ParseDouble("-0x")));
  EXPECT_EQ(ParseDouble("-2.5e1x"), -25.0);
  LocaleInfo comma;
  comma.decimalSeparator = ',';
  EXPECT_EQ(CalcResultText(ApplyOperation(kMax, ParseDouble("-\"9 a"), 0.0), k4Places, comma), "0,0000");
}

TEST(CalcOperandTest, EveryTypeGivesANumber) {
  TestDb t;
  const int name = t.Field(FieldType::Text, "Name");
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int price = t.Field(FieldType::Float, "Price");
  const int color = t.Field(FieldType::PopUp, "Color");
  const int done = t.Field(FieldType::CheckBox, "Done");
  const int due = t.Field(FieldType::Date, "Due");
  const int at = t.Field(FieldType::Time, "At");
  const int owner = t.Field(FieldType::Linked, "Owner");
  const int photo = t.Field(FieldType::Image, "Photo");
  t.Add({Text(name, " 12.5kg"), Num(qty, static_cast<uint32_t>(-4)), Text(price, "2,5"), Byte(color, 3),
         Byte(done, 9), Num(due, 366), TimeVal(at, 1, 2, 3), Text(owner, "7.25")});
  t.Add({TimeVal(at, 255, 10, 5)});
  const ByteView r = t.db.record(0);
  EXPECT_EQ(FieldOperandValue(t.db, r, name), 12.5);
  EXPECT_EQ(FieldOperandValue(t.db, r, qty), -4);
  EXPECT_EQ(FieldOperandValue(t.db, r, price), 2) << "\",\" ends the number";
  EXPECT_EQ(FieldOperandValue(t.db, r, color), 3);
  EXPECT_EQ(FieldOperandValue(t.db, r, done), 1);
  EXPECT_EQ(FieldOperandValue(t.db, r, due), 366);
  EXPECT_EQ(FieldOperandValue(t.db, r, at), 3723);
  EXPECT_EQ(FieldOperandValue(t.db, r, owner), 7.25);
  EXPECT_EQ(FieldOperandValue(t.db, r, photo), 0);
  EXPECT_EQ(FieldOperandValue(t.db, t.db.record(1), at), 605) << "\"No Time\" counts as hour 0";
  EXPECT_EQ(FieldOperandValue(t.db, testing::RawRecord({}), name), 0);
}

TEST(CalcRecordTest, ConstantsFieldsAndDisplayOrder) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  // "Later" is shown after "Early", and "Early" uses it: Early sees Later's
  // value from before this evaluation.
  const int early = t.Calc("Early", kAdd, kInteger, kConst, kConst, 0, "1", "0");
  const int later = t.Calc("Later", kMul, kInteger, qty, kConst, 0, "", "2.5abc");
  t.db.schema().field[early].param1 = static_cast<uint8_t>(later);
  t.Add({Num(qty, 4), Text(later, "100")});
  ASSERT_EQ(RecalculateRecord(t.session, 0), 0);
  EXPECT_EQ(t.TextAt(0, later), "10");
  EXPECT_EQ(t.TextAt(0, early), "100");
  EXPECT_EQ(t.session.calc.fieldChanged[early], 1);
  EXPECT_EQ(t.session.calc.fieldChanged[later], 1);
  // Show Later first: one pass now brings Early up to date.
  std::swap(t.db.schema().fieldOrder[early], t.db.schema().fieldOrder[later]);
  t.session.calc.fieldChanged = {};
  ASSERT_EQ(RecalculateRecord(t.session, 0), 0);
  EXPECT_EQ(t.TextAt(0, early), "10");
  EXPECT_EQ(t.session.calc.fieldChanged[early], 1);
  EXPECT_EQ(t.session.calc.fieldChanged[later], 0) << "unchanged text, no mark";
  EXPECT_EQ(RecalculateRecord(t.session, 5), -1);
}

TEST(CalcRecordTest, ARecordWithoutTheSlotGrowsIt) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int name = t.Field(FieldType::Text, "Name");
  const int total = t.Calc("Total", kAdd, k2Places, qty, kConst, 0, "", "1");
  t.db.AppendRecord(testing::RawRecord({testing::Le32(41)}));
  t.Add({Num(qty, 1), Text(name, "keep me"), Text(total, "old")});
  ASSERT_EQ(RecalculateFrom(t.session, 0), 0);
  EXPECT_EQ(t.TextAt(0, total), "42.00");
  EXPECT_EQ(t.NumberAt(0, qty), 41u);
  EXPECT_EQ(t.TextAt(1, total), "2.00");
  EXPECT_EQ(t.TextAt(1, name), "keep me");
}

// A pass finds a record's slots once and moves them along as results
// change size: results that grow and shrink ahead of other values, a value
// that ran past the record's end, and a record that ends before the slots.
TEST(CalcRecordTest, ResultsOfEverySizeLeaveTheOtherValuesInPlace) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int first = t.Calc("First", kAdd, k4Places, qty, kConst, 0, "", "1");
  const int name = t.Field(FieldType::Text, "Name");
  const int second = t.Calc("Second", kMul, k2Places, first, kConst, 0, "", "2");
  const int note = t.Field(FieldType::Note, "Note");
  t.Add({Num(qty, 4), Text(first, "x"), Text(name, "keep"), Text(second, "a much longer old text"),
         Text(note, "tail")});
  Bytes overrun = testing::RawRecord({testing::Le32(9)}, false);
  overrun.insert(overrun.end(), {0x40, 0x00, '1', '2', '3'});
  t.db.AppendRecord(overrun);
  t.db.AppendRecord(testing::RawRecord({testing::Le32(7)}));
  t.Add({Num(qty, 1000), Text(first, "1001.0000"), Text(name, "same"), Text(second, "0")});

  ASSERT_EQ(RecalculateFrom(t.session, 0), 0);
  EXPECT_EQ(t.TextAt(0, first), "5.0000");
  EXPECT_EQ(t.TextAt(0, second), "10.00");
  EXPECT_EQ(t.TextAt(0, name), "keep");
  EXPECT_EQ(t.TextAt(0, note), "tail");
  EXPECT_EQ(t.TextAt(1, first), "10.0000");
  EXPECT_EQ(t.TextAt(1, second), "20.00");
  EXPECT_EQ(t.TextAt(2, first), "8.0000");
  EXPECT_EQ(t.TextAt(2, second), "16.00");
  EXPECT_EQ(t.TextAt(3, second), "2002.00");
  EXPECT_EQ(t.TextAt(3, name), "same");
  for (size_t i = 0; i < t.db.recordCount(); ++i) EXPECT_TRUE(RecordIsWellFormed(t.db.record(i))) << i;
}

TEST(CalcPassTest, PrevRecordRunsThroughTheRecordsInView) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int keep = t.Field(FieldType::CheckBox, "Keep");
  const int running = t.Calc("Running", kAdd, kInteger, qty, kConst, 0, "", "0");
  t.db.schema().field[running].param2 = static_cast<uint8_t>(running);
  t.db.schema().field[running].calcFlags = 2;  // value 2 from the previous record
  for (auto [q, k] : {std::pair{1u, 1}, {10u, 0}, {100u, 1}, {1000u, 1}}) {
    t.Add({Num(qty, q), Byte(keep, static_cast<uint8_t>(k)), Text(running, "stale")});
  }
  EXPECT_EQ(NeedsPrevRecord(t.db), 1);
  ASSERT_EQ(RecalculateFrom(t.session, 0), 0);
  EXPECT_EQ(t.TextAt(0, running), "1") << "no previous record: 0";
  EXPECT_EQ(t.TextAt(3, running), "1111");

  FilterSettings f = LoadFilterSettings(t.db.schema());
  f.filter[0].enabled = true;
  f.filter[0].field = keep;
  f.filter[0].lowerNumber = 1;
  StoreFilterSettings(f, t.db.schema());
  t.db.ReplaceRecord(1, t.Build({Num(qty, 10), Byte(keep, 0), Text(running, "stale")}));
  ASSERT_EQ(RecalculateFrom(t.session, 0), 0);
  EXPECT_EQ(t.TextAt(1, running), "stale") << "out of view: not recalculated";
  EXPECT_EQ(t.TextAt(2, running), "101") << "the previous record in view is record 0";
  EXPECT_EQ(t.TextAt(3, running), "1101");
  EXPECT_FALSE(t.session.calc.busy);
  EXPECT_TRUE(t.db.changed());
}

TEST(CalcPassTest, CalculatedSortKeySortsAfterEveryPass) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int neg = t.Calc("Neg", kSub, kInteger, kConst, qty, 0, "0");
  const int running = t.Calc("Running", kAdd, kInteger, qty, kConst);
  t.db.schema().field[running].param2 = static_cast<uint8_t>(running);
  t.db.schema().field[running].calcFlags = 2;
  for (uint32_t q : {1, 3, 2}) t.Add({Num(qty, q)});
  SortOn(t.db, neg);
  ASSERT_EQ(RecalculateFrom(t.session, 0), 0);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{1, 2, 0}));
  EXPECT_FALSE(t.session.calc.resortPending);
  // The previous-record pass ran over the new order.
  EXPECT_EQ(t.TextAt(0, running), "3");
  EXPECT_EQ(t.TextAt(1, running), "5");
  EXPECT_EQ(t.TextAt(2, running), "6");
}

TEST(CalcPassTest, PendingResortRunsBeforeAPassWithoutCalculatedKey) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int twice = t.Calc("Twice", kMul, kInteger, qty, kConst, 0, "", "2");
  for (uint32_t q : {3, 1, 2}) t.Add({Num(qty, q), Text(twice, "stale")});
  SortOn(t.db, qty);
  t.session.calc.resortPending = true;  // left by a pass that stopped early
  ASSERT_EQ(RecalculateFrom(t.session, 2), 0);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{1, 2, 0}));
  EXPECT_FALSE(t.session.calc.resortPending);
  for (size_t i = 0; i < 3; ++i) EXPECT_NE(t.TextAt(i, twice), "stale") << "recalculated from record 0";
}

TEST(CalcPassTest, NoCalculatedFieldsStillMarksChanged) {
  TestDb t;
  t.Field(FieldType::Integer, "Qty");
  t.db.ClearChanged();
  EXPECT_EQ(RecalculateFrom(t.session, 0), 0);
  EXPECT_TRUE(t.db.changed());
  EXPECT_EQ(NeedsPrevRecord(t.db), 0);
}

// A save that writes the records while the recalculation finishes them
// gives the very file that recalculating and then saving gives: over all
// records, over those in view only, with a calculated sort key (the walk's
// records move again after it), and from a record in the middle.
TEST(CalcSaveAlongTest, SameFileAsRecalculatingThenSaving) {
  testing::TempDir dir;
  const FixedClock clock(1700000000);
  std::mt19937 rng(11);
  for (int variant = 0; variant < 4; ++variant) {
    TestDb t;
    const int qty = t.Field(FieldType::Integer, "Qty");
    const int keep = t.Field(FieldType::CheckBox, "Keep");
    const int twice = t.Calc("Twice", kMul, k2Places, qty, kConst, 0, "", "2.5");
    const int neg = t.Calc("Neg", kSub, kInteger, kConst, qty, 0, "0");
    const int running = t.Calc("Running", kAdd, kInteger, qty, kConst, 2);
    t.db.schema().field[running].param2 = static_cast<uint8_t>(running);
    for (int i = 0; i < 5000; ++i) {
      t.Add({Num(qty, rng() % 1000), Byte(keep, static_cast<uint8_t>(rng() % 2)), Text(twice, "stale")});
    }
    SortOn(t.db, variant == 2 ? neg : qty);
    if (variant == 1) {
      FilterSettings f = LoadFilterSettings(t.db.schema());
      f.filter[0].enabled = true;
      f.filter[0].field = keep;
      f.filter[0].lowerNumber = 1;
      StoreFilterSettings(f, t.db.schema());
    }
    const size_t start = variant == 3 ? 1234 : 0;

    Database plain = t.db;
    DataSession plainSession(plain, t.locale, t.ui);
    ASSERT_EQ(RecalculateFrom(plainSession, start), 0);
    ASSERT_TRUE(plain.SaveAs(dir.File("Plain.PDB"), clock));

    t.db.SetPath(dir.File("Along.PDB"));
    ASSERT_TRUE(RecalculateWhileSaving(t.session, [&] { RecalculateFrom(t.session, start); }, clock));
    EXPECT_FALSE(t.db.changed());
    EXPECT_EQ(t.session.savingAlong, nullptr);
    std::vector<uint8_t> along, plainBytes;
    ASSERT_TRUE(ReadWholeFile(dir.File("Along.PDB"), along));
    ASSERT_TRUE(ReadWholeFile(dir.File("Plain.PDB"), plainBytes));
    EXPECT_TRUE(along == plainBytes) << "variant " << variant;
  }
}

// When the save fails the recalculation still runs to its end, and the
// database stays changed.
TEST(CalcSaveAlongTest, AFailedSaveLeavesTheRecalculationDone) {
  TestDb t;  // its file lies in a folder that does not exist
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int twice = t.Calc("Twice", kMul, kInteger, qty, kConst, 0, "", "2");
  for (uint32_t q : {1, 2, 3}) t.Add({Num(qty, q), Text(twice, "stale")});
  const Status saved = RecalculateWhileSaving(t.session, [&] { RecalculateFrom(t.session, 0); });
  EXPECT_FALSE(saved);
  EXPECT_EQ(t.TextAt(2, twice), "6");
  EXPECT_TRUE(t.db.changed());
}

TEST(CalcAfterMoveTest, MovesAndChangedFieldsDecide) {
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int other = t.Field(FieldType::Integer, "Other");
  const int prevQty = t.Calc("PrevQty", kAdd, kInteger, qty, kConst, 1, "", "0");
  const int viaPrev = t.Calc("ViaPrev", kAdd, kInteger, prevQty, kConst, 0, "", "0");
  (void)viaPrev;
  for (uint32_t q : {5, 6, 7}) t.Add({Num(qty, q), Text(prevQty, "stale")});

  // Nothing moved and nothing changed: no pass.
  EXPECT_EQ(RecalculateAfterMove(t.session, 1, 1), 0);
  EXPECT_EQ(t.TextAt(2, prevQty), "stale");
  // A changed field that no previous-record operand reads: still none.
  t.session.calc.fieldChanged[other] = 1;
  EXPECT_EQ(RecalculateAfterMove(t.session, 1, 1), 0);
  EXPECT_EQ(t.TextAt(2, prevQty), "stale");
  // Qty changed, and PrevQty reads the previous record's Qty: recalculate
  // from the record on.
  t.session.calc.fieldChanged[qty] = 1;
  EXPECT_EQ(RecalculateAfterMove(t.session, 1, 1), 0);
  EXPECT_EQ(t.TextAt(0, prevQty), "stale");
  EXPECT_EQ(t.TextAt(1, prevQty), "5");
  EXPECT_EQ(t.TextAt(2, prevQty), "6");
  // A move recalculates from the smaller index whenever a previous-record
  // operand exists.
  t.session.calc.fieldChanged = {};
  t.db.MoveRecord(2, 0);
  EXPECT_EQ(RecalculateAfterMove(t.session, 2, 0), 0);
  EXPECT_EQ(t.TextAt(0, prevQty), "0");
  EXPECT_EQ(t.TextAt(1, prevQty), "7");
}

TEST(PendingWorkTest, OpeningRunsWhatTheFileOwes) {
  testing::TempDir dir;
  TestDb t;
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int prev = t.Calc("Prev", kAdd, kInteger, qty, kConst, 1, "", "0");
  for (uint32_t q : {3, 1, 2}) t.Add({Num(qty, q), Text(prev, "stale")});
  SortOn(t.db, qty);

  auto reopen = [&](uint16_t recalcFrom, uint8_t resort, PendingWork expected) {
    Database file = t.db;
    file.schema().recalcFrom = recalcFrom;
    file.schema().resortPending = resort;
    EXPECT_TRUE(file.SaveAs(dir.File("Owed.PDB")));
    Database db;
    testing::ScriptedUi ui;
    DataSession s(db, t.locale, ui);
    EXPECT_TRUE(db.Open(dir.File("Owed.PDB"), ui));
    EXPECT_EQ(RunPendingWork(s), expected);
    EXPECT_EQ(db.schema().recalcFrom, 0);
    return db;
  };

  // Set to 1 by a record that arrived: recalculate from the first record.
  Database a = reopen(1, 0, PendingWork::Recalculated);
  EXPECT_EQ(ValueString(*FieldValue(a.record(1), prev)), "3");
  EXPECT_EQ(a.entry(0).uniqueID(), 0u) << "not re-sorted";
  EXPECT_TRUE(a.changed());
  // Past the last record: only cleared.
  Database b = reopen(31 + 3, 0, PendingWork::None);
  EXPECT_EQ(ValueString(*FieldValue(b.record(1), prev)), "stale");
  // A pending re-sort: sorted and recalculated, and cleared.
  Database c = reopen(0, 1, PendingWork::Resorted);
  EXPECT_EQ(c.entry(0).uniqueID(), 1u);
  EXPECT_EQ(c.schema().resortPending, 0);
  EXPECT_EQ(ValueString(*FieldValue(c.record(1), prev)), "1");
  // Both marks: the recalculation runs, the re-sort waits for the next
  // opening.
  Database d = reopen(31 + 1, 1, PendingWork::Recalculated);
  EXPECT_EQ(d.schema().resortPending, 1);
  EXPECT_EQ(ValueString(*FieldValue(d.record(0), prev)), "stale");
  EXPECT_EQ(ValueString(*FieldValue(d.record(1), prev)), "3");

  // OpenDatabase does the same and builds the view.
  Database owed = t.db;
  owed.schema().resortPending = 1;
  ASSERT_TRUE(owed.SaveAs(dir.File("Owed.PDB")));
  Database e;
  DataSession s(e, t.locale, t.ui);
  ASSERT_TRUE(OpenDatabase(s, dir.File("Owed.PDB")));
  EXPECT_EQ(e.entry(0).uniqueID(), 1u);
  EXPECT_EQ(s.view, (std::vector<uint32_t>{0, 1, 2}));
  EXPECT_FALSE(OpenDatabase(s, dir.File("Missing.PDB")));
  EXPECT_EQ(e.recordCount(), 3u);
}

}  // namespace
}  // namespace cx
