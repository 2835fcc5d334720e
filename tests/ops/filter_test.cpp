#include <gtest/gtest.h>

#include "engine/record_store.h"
#include "engine/schema.h"
#include "ops/database_settings.h"
#include "ops/delete_records.h"
#include "ops/filter_dialog.h"
#include "ops/view.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Byte;
using testing::Num;
using testing::TestDb;
using testing::Text;
using testing::TimeVal;

// The controls of one enabled filter on `field`, as the user left them.
FilterDialogFilter Controls(int field) {
  FilterDialogFilter d;
  d.enabled = true;
  d.field = field;
  return d;
}

class ViewFilterTest : public ::testing::Test {
 protected:
  // Switches filter `n` (0 or 1) on for `field` and lets `set` fill it in.
  template <typename Set>
  void On(int n, int field, Set set, bool negate = false) {
    FilterSettings s = LoadFilterSettings(t.db.schema());
    s.filter[n].enabled = true;
    s.filter[n].field = field;
    set(s.filter[n]);
    const uint8_t bit = n == 0 ? kFilterNot1 : kFilterNot2;
    s.combination = static_cast<uint8_t>(negate ? (s.combination | bit) : (s.combination & ~bit));
    StoreFilterSettings(s, t.db.schema());
  }
  void UseOr(bool on) {
    FilterSettings s = LoadFilterSettings(t.db.schema());
    s.combination = static_cast<uint8_t>(on ? (s.combination | kFilterOr) : (s.combination & ~kFilterOr));
    StoreFilterSettings(s, t.db.schema());
  }
  std::vector<uint32_t> View(const LinkRestriction* link = nullptr) { return RebuildView(t.db, link); }

  TestDb t;
};

TEST_F(ViewFilterTest, EverythingIsInViewWithoutFiltersOrLink) {
  const int name = t.Field(FieldType::Text, "Name");
  t.Add({Text(name, "a")});
  t.db.AppendRecord(Bytes{});
  t.Add({Text(name, "b")});
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1, 2}));
  EXPECT_EQ(RecordInView(t.db, 3), 0) << "past the table";
}

TEST_F(ViewFilterTest, NotOnCheckBoxKeepsTheUncheckedRecords) {
  const int done = t.Field(FieldType::CheckBox, "Done");
  for (uint8_t v : {1, 0, 1, 0, 0}) t.Add({Byte(done, v)});
  On(0, done, [](Filter& f) { f.lowerNumber = 1; }, true);
  EXPECT_EQ(View(), (std::vector<uint32_t>{1, 3, 4}));
}

TEST_F(ViewFilterTest, TwoFiltersCombineWithAndOrAndNot) {
  const int a = t.Field(FieldType::Integer, "A");
  const int b = t.Field(FieldType::Integer, "B");
  // Records: (a, b) = (1,1) (1,0) (0,1) (0,0).
  for (auto [x, y] : {std::pair{1u, 1u}, {1u, 0u}, {0u, 1u}, {0u, 0u}}) t.Add({Num(a, x), Num(b, y)});
  auto one = [](Filter& f) {
    f.lowerNumber = 1;
    f.upperNumber = 1;
  };
  On(0, a, one);
  On(1, b, one);
  EXPECT_EQ(View(), (std::vector<uint32_t>{0}));
  UseOr(true);
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1, 2}));
  On(1, b, one, true);
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1, 3}));
  UseOr(false);
  EXPECT_EQ(View(), (std::vector<uint32_t>{1}));
  // Only filter 2 on: its result stands alone.
  FilterSettings s = LoadFilterSettings(t.db.schema());
  s.filter[0].enabled = false;
  StoreFilterSettings(s, t.db.schema());
  EXPECT_EQ(View(), (std::vector<uint32_t>{1, 3}));
}

TEST_F(ViewFilterTest, TextFilterContainsIgnoringCaseAndEmptyMeansEmpty) {
  const int name = t.Field(FieldType::Text, "Name");
  for (const char* s : {"Anchor", "", "BRANCH", "tree"}) t.Add({Text(name, s)});
  On(0, name, [](Filter& f) { f.SetLowerText("anch"); });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 2}));
  On(0, name, [](Filter& f) { f.SetLowerText(""); });
  EXPECT_EQ(View(), (std::vector<uint32_t>{1}));
}

TEST_F(ViewFilterTest, LinkedFilterNeedsTheTextPart) {
  const int owner = t.Field(FieldType::Linked, "Owner");
  t.Add({Text(owner, "Smith")});
  t.db.AppendRecord(testing::RawRecord({Bytes(20, 0)}));
  t.Add({Text(owner, "")});
  On(0, owner, [](Filter& f) { f.SetLowerText("MIT"); });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0}));
  On(0, owner, [](Filter& f) { f.SetLowerText(""); });
  EXPECT_EQ(View(), (std::vector<uint32_t>{2})) << "a value under 25 bytes never passes";
}

TEST_F(ViewFilterTest, NumberLimitsBySignedness) {
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int id = t.Field(FieldType::Unique, "Id");
  t.Add({Num(qty, static_cast<uint32_t>(-5)), Num(id, 0xFFFFFFF0u)});
  t.Add({Num(qty, 5), Num(id, 5)});
  t.Add({Num(qty, 50), Num(id, 50)});
  On(0, qty, [](Filter& f) {
    f.lowerNumber = -10;
    f.upperNumber = 10;
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1}));
  On(0, id, [](Filter& f) {
    f.lowerNumber = 10;
    f.upperNumber = -1;  // 0xFFFFFFFF as an unsigned limit
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 2}));
}

TEST_F(ViewFilterTest, FloatDateAndTimeLimits) {
  const int price = t.Field(FieldType::Float, "Price");
  const int due = t.Field(FieldType::Date, "Due");
  const int at = t.Field(FieldType::Time, "At");
  t.Add({Text(price, "2.5"), Num(due, 100), TimeVal(at, 9, 0, 0)});
  t.Add({Text(price, "10"), Num(due, 0), TimeVal(at, 255, 0, 0)});
  t.Add({Text(price, ""), Num(due, 400), TimeVal(at, 12, 30, 0)});
  On(0, price, [](Filter& f) {
    f.SetLowerText("0");
    f.SetUpperText("9.99");
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 2})) << "an empty value reads as 0";
  On(0, due, [](Filter& f) {
    f.SetLowerDay(50);
    f.SetUpperDay(400);
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 2}));
  On(0, at, [](Filter& f) {
    f.SetLowerTime(9, 0, 0);
    f.SetUpperTime(255, 0, 0);
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1, 2}));
  On(0, at, [](Filter& f) {
    f.SetLowerTime(10, 0, 0);
    f.SetUpperTime(23, 59, 59);
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{2}));
}

TEST_F(ViewFilterTest, CalculatedFiltersFollowTheResultFormat) {
  const int whole = t.Calc("Whole", 0, 1, 255, 255);
  const int secs = t.Calc("Secs", 0, 2, 255, 255);
  const int day = t.Calc("Day", 0, 3, 255, 255);
  const int dec = t.Calc("Dec", 0, 5, 255, 255);
  const int odd = t.Calc("Odd", 0, 8, 255, 255);
  t.Add({Text(whole, "12"), Text(secs, "3600"), Text(day, "366"), Text(dec, "1.25"), Text(odd, "1")});
  t.Add({Text(whole, "-3x"), Text(secs, "30"), Text(day, "10"), Text(dec, "7,5"), Text(odd, "1")});
  On(0, whole, [](Filter& f) {
    f.lowerNumber = -3;
    f.upperNumber = 0;
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{1}));
  On(0, secs, [](Filter& f) {
    f.SetLowerTime(1, 0, 0);
    f.SetUpperTime(255, 30, 0);  // hour 255 counts as 0: 0:30:00
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{}));
  On(0, secs, [](Filter& f) { f.SetUpperTime(2, 0, 0); });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0}));
  On(0, day, [](Filter& f) {
    f.SetLowerDay(0);
    f.SetUpperDay(100);
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{1}));
  On(0, dec, [](Filter& f) {
    f.SetLowerText("1");
    f.SetUpperText("7");
  });
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1})) << "\"7,5\" reads as 7";
  On(0, odd, [](Filter&) {});
  EXPECT_EQ(View(), (std::vector<uint32_t>{}));
}

TEST_F(ViewFilterTest, MissingSlotsAndUnknownTypesFail) {
  const int name = t.Field(FieldType::Text, "Name");
  const int photo = t.Field(FieldType::Image, "Photo");
  const int odd = t.Field(FieldType::Text, "Odd");
  t.Add({Text(name, "x")});
  t.db.AppendRecord(testing::RawRecord({testing::Str("x")}));
  On(0, photo, [](Filter&) {});
  EXPECT_EQ(View(), (std::vector<uint32_t>{0})) << "Image passes, but only with its slot";
  t.db.schema().field[odd].typeNumber = 16;
  On(0, odd, [](Filter&) {});
  EXPECT_EQ(View(), (std::vector<uint32_t>{}));
  EXPECT_EQ(FilterTest(t.db, 1, t.db.record(0)), 0);
  EXPECT_EQ(FilterTest(t.db, 3, t.db.record(0)), 0);
}

TEST_F(ViewFilterTest, LinkRestrictionComesFirst) {
  const int owner = t.Field(FieldType::Integer, "Owner");
  const int done = t.Field(FieldType::CheckBox, "Done");
  t.Add({Num(owner, 7), Byte(done, 1)});
  t.Add({Num(owner, 8), Byte(done, 1)});
  t.Add({Num(owner, 7), Byte(done, 0)});
  LinkRestriction link{owner, 7};
  EXPECT_EQ(View(&link), (std::vector<uint32_t>{0, 2}));
  On(0, done, [](Filter& f) { f.lowerNumber = 1; });
  UseOr(true);
  On(1, done, [](Filter& f) { f.lowerNumber = 0; });
  EXPECT_EQ(View(&link), (std::vector<uint32_t>{0, 2}));
  LinkRestriction none{-1, 7};
  EXPECT_EQ(View(&none), (std::vector<uint32_t>{0, 1, 2}));
}

TEST_F(ViewFilterTest, DialogStoresNoValueDifferentlyPerFilter) {
  const int color = t.Field(FieldType::PopUp, "Color");
  t.db.popups()[color].items = {"Red", "Green"};
  t.Add({Byte(color, 255)});
  t.Add({Byte(color, 1)});
  FilterDialogValues values = OpenFilterDialog(t.db);
  values.filter[0] = Controls(color);
  values.filter[0].popupChoice = kNoValueChoice;
  AcceptFilterDialog(t.db, values);
  EXPECT_EQ(t.db.schema().filter[0].low, 255u);
  EXPECT_EQ(View(), (std::vector<uint32_t>{0}));

  values.filter[0].enabled = false;
  values.filter[1] = Controls(color);
  values.filter[1].popupChoice = kNoValueChoice;
  AcceptFilterDialog(t.db, values);
  EXPECT_EQ(t.db.schema().filter[1].low, 597u);
  EXPECT_EQ(View(), (std::vector<uint32_t>{})) << "filter 2 on \"No Value\" matches nothing";
  EXPECT_EQ(OpenFilterDialog(t.db).filter[1].popupChoice, kNoValueChoice);

  values.filter[1].popupChoice = 1;
  values.filter[1].notChecked = true;
  AcceptFilterDialog(t.db, values);
  EXPECT_EQ(View(), (std::vector<uint32_t>{0}));
  DisableBothFilters(t.db);
  EXPECT_EQ(View(), (std::vector<uint32_t>{0, 1}));
}

TEST_F(ViewFilterTest, DialogStoresOnlyWhatTheTypeUses) {
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int price = t.Field(FieldType::Float, "Price");
  const int due = t.Field(FieldType::Date, "Due");
  const int at = t.Field(FieldType::Time, "At");
  const int secs = t.Calc("Secs", 0, 2, 255, 255);
  EXPECT_EQ(FilterControlsFor(t.db.schema(), secs), FilterControls::TimeLimits);
  EXPECT_EQ(FilterControlsFor(t.db.schema(), qty), FilterControls::WholeLimits);

  FilterDialogValues values;
  values.filter[0] = Controls(qty);
  values.filter[0].lowerLimit = "-12abc";
  values.filter[0].upperLimit = " 40";
  values.filter[1] = Controls(price);
  values.filter[1].lowerLimit = "1.5";
  values.filter[1].upperLimit = "x";
  values.orBetween = true;
  AcceptFilterDialog(t.db, values);
  FilterSettings s = LoadFilterSettings(t.db.schema());
  EXPECT_EQ(s.filter[0].lowerNumber, -12);
  EXPECT_EQ(s.filter[0].upperNumber, 40);
  EXPECT_EQ(s.filter[1].LowerText(), "1.5");
  EXPECT_EQ(s.filter[1].UpperText(), "x");
  EXPECT_EQ(s.filter[1].lowerNumber, 0) << "untouched by a Float filter";
  EXPECT_TRUE(s.UsesOr());

  values.filter[0] = Controls(due);
  values.filter[0].lowerDay = 366;
  values.filter[0].upperDay = 400;
  values.filter[1] = Controls(at);
  values.filter[1].lowerTime = {9, 30, 5};
  values.filter[1].upperTime = {17, 0, 0};
  AcceptFilterDialog(t.db, values);
  s = LoadFilterSettings(t.db.schema());
  EXPECT_EQ(s.filter[0].LowerDay(), 366u);
  EXPECT_EQ(s.filter[0].lowerNumber, -12) << "kept from before";
  EXPECT_EQ(s.filter[1].LowerTime(), 5u | (30u << 8) | (9u << 16));
  const FilterDialogValues reopened = OpenFilterDialog(t.db);
  EXPECT_EQ(reopened.filter[1].upperTime.hours, 17);
  EXPECT_EQ(reopened.filter[0].upperDay, 400u);
}

// The filter, combination and search settings live in the schema record:
// they must come back from the file, and bytes they do not use must stay.
TEST(SettingsFormatTest, SettingsSurviveSaveAndReopen) {
  testing::TempDir dir;
  testing::ScriptedUi ui;
  Database db = Database::CreateNew(dir.File("Settings.PDB"), "Settings");
  db.schema().field[0].typeNumber = static_cast<int16_t>(FieldType::Text);
  // Bits and bytes another program may have set.
  db.schema().filter[0].mode = 0x0108;
  db.schema().filter[1].mode = 0x0004;
  db.schema().findOption1 = 7;

  FilterSettings f = LoadFilterSettings(db.schema());
  EXPECT_FALSE(f.AnyEnabled());
  EXPECT_EQ(f.combination, 0);
  f.filter[0].enabled = true;
  f.filter[0].SetLowerText("needle");
  f.filter[1].enabled = true;
  f.filter[1].field = 29;
  f.filter[1].SetLowerDay(12345);
  f.filter[1].upperNumber = -7;
  f.combination = kFilterNot1 | kFilterOr | kFilterNot2;
  StoreFilterSettings(f, db.schema());
  SearchSettings search{.field = -1, .caseSensitive = true, .text = "find me", .beginsWith = true};
  StoreSearchSettings(search, db.schema());
  SetSortPopups(db.schema(), 3, true);
  ASSERT_TRUE(db.Save());

  Database back;
  ASSERT_TRUE(back.Open(dir.File("Settings.PDB"), ui));
  const FilterSettings g = LoadFilterSettings(back.schema());
  EXPECT_TRUE(g.filter[0].enabled && g.filter[1].enabled);
  EXPECT_EQ(g.combination, kFilterNot1 | kFilterOr | kFilterNot2);
  EXPECT_EQ(g.filter[0].LowerText(), "needle");
  EXPECT_EQ(g.filter[1].field, 29);
  EXPECT_EQ(g.filter[1].LowerDay(), 12345u);
  EXPECT_EQ(g.filter[1].upperNumber, -7);
  EXPECT_EQ(back.schema().filter[0].mode, 0x010F);
  EXPECT_EQ(back.schema().filter[1].mode, 0x0007);
  EXPECT_EQ(back.schema().findOption1, 7) << "an equal flag keeps its byte";
  const SearchSettings s = LoadSearchSettings(back.schema());
  EXPECT_EQ(s.field, -1);
  EXPECT_EQ(back.schema().findField, 255);
  EXPECT_TRUE(s.caseSensitive && s.beginsWith);
  EXPECT_EQ(s.text, "find me");
  EXPECT_TRUE(SortPopupsOn(back.schema(), 3));

  // Reading and storing unchanged settings changes no byte of the record.
  const std::vector<uint8_t> before = WriteSchema(back.schema());
  StoreFilterSettings(LoadFilterSettings(back.schema()), back.schema());
  StoreSearchSettings(LoadSearchSettings(back.schema()), back.schema());
  EXPECT_EQ(WriteSchema(back.schema()), before);

  // Switching off clears only the switch bits.
  DisableBothFilters(back);
  EXPECT_EQ(back.schema().filter[0].mode, 0x010E);
  EXPECT_EQ(back.schema().filter[1].mode, 0x0006);
}

class RecordingDeleter : public LinkedRecordDeleter {
 public:
  void DeleteLinkedTo(const Database& db, size_t index) override {
    seen.push_back(db.entry(index).uniqueID());
  }
  std::vector<uint32_t> seen;
};

TEST_F(ViewFilterTest, DeleteRecordsByScope) {
  const int done = t.Field(FieldType::CheckBox, "Done");
  for (uint8_t v : {1, 0, 1, 1, 0}) t.Add({Byte(done, v)});
  EXPECT_EQ(DeleteRecords(t.session, DeleteScope::OutsideFilterRange, nullptr), 0u)
      << "with both filters off every record is within range";
  On(0, done, [](Filter& f) { f.lowerNumber = 1; });
  RecordingDeleter linked;
  EXPECT_EQ(DeleteRecords(t.session, DeleteScope::WithinFilterRange, &linked), 3u);
  EXPECT_EQ(t.Ids(), (std::vector<uint32_t>{1, 4}));
  EXPECT_EQ(linked.seen, (std::vector<uint32_t>{0, 2, 3}));
  EXPECT_TRUE(t.session.view.empty());
  t.Add({Byte(done, 1)});
  EXPECT_EQ(DeleteRecords(t.session, DeleteScope::OutsideFilterRange, nullptr), 2u);
  EXPECT_EQ(t.session.view, (std::vector<uint32_t>{0}));
  EXPECT_EQ(DeleteRecords(t.session, DeleteScope::All, nullptr), 1u);
  EXPECT_EQ(t.db.recordCount(), 0u);
}

TEST_F(ViewFilterTest, DeleteAsksAboutLinkedRecordsOnlyWithLinkFields) {
  const int done = t.Field(FieldType::CheckBox, "Done");
  t.Add({Byte(done, 1)});
  t.Add({Byte(done, 0)});
  RecordingDeleter linked;
  DeleteRecordsCommand(t.session, DeleteScope::All, &linked);
  EXPECT_TRUE(t.ui.questions.empty());
  EXPECT_TRUE(linked.seen.empty());

  const int parts = t.Field(FieldType::Link, "Parts");
  t.Add({Num(parts, 3)});
  t.Add({Num(parts, 4)});
  t.ui.yesNoAnswers = {true};
  DeleteRecordsCommand(t.session, DeleteScope::All, &linked);
  ASSERT_EQ(t.ui.questions.size(), 1u);
  EXPECT_EQ(t.ui.questions[0].text, "Would you like to delete the linked records also? (Y/N)");
  EXPECT_EQ(t.ui.questions[0].caption, "QUESTION");
  EXPECT_EQ(linked.seen.size(), 2u);
}

}  // namespace
}  // namespace cx
