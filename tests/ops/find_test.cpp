#include <gtest/gtest.h>

#include "ops/database_settings.h"
#include "ops/field_values.h"
#include "ops/find.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Byte;
using testing::Num;
using testing::TestDb;
using testing::Text;
using testing::TimeVal;

class FindTest : public ::testing::Test {
 protected:
  // FieldMatches as the search calls it: the needle lower-cased unless
  // the search is case-sensitive.
  bool Matches(size_t index, int field, const std::string& needle, bool caseSensitive = false,
               bool beginsWith = false) {
    const std::string n = caseSensitive ? needle : LowerAscii(needle);
    return FieldMatches(t.db, t.db.record(index), field, n, caseSensitive, beginsWith, t.locale) == 1;
  }
  TestDb t;
};

TEST_F(FindTest, IntegersMatchOnlyDigitNeedles) {
  const int qty = t.Field(FieldType::Integer, "Qty");
  const int id = t.Field(FieldType::Unique, "Id");
  t.Add({Num(qty, 312), Num(id, 4120)});
  t.Add({Num(qty, static_cast<uint32_t>(-125)), Num(id, 0)});
  EXPECT_TRUE(Matches(0, qty, "12"));
  EXPECT_FALSE(Matches(0, qty, "12a"));
  EXPECT_FALSE(Matches(0, qty, ""));
  EXPECT_FALSE(Matches(0, qty, "-1"));
  EXPECT_TRUE(Matches(1, qty, "12"));
  EXPECT_FALSE(Matches(1, qty, "12", false, true)) << "the text begins with the minus sign";
  EXPECT_TRUE(Matches(0, id, "41", false, true));
}

TEST_F(FindTest, TextsFoldCaseUnlessCaseSensitive) {
  const int name = t.Field(FieldType::Text, "Name");
  const int price = t.Field(FieldType::Float, "Price");
  const int color = t.Field(FieldType::PopUp, "Color");
  const int owner = t.Field(FieldType::Linked, "Owner");
  t.db.popups()[color].items = {"Dark Red"};
  t.Add({Text(name, "Hello World"), Text(price, "1E5"), Byte(color, 0), Text(owner, "McKay")});
  t.Add({Text(name, ""), Text(price, ""), Byte(color, 255)});
  EXPECT_TRUE(Matches(0, name, "WORLD"));
  EXPECT_FALSE(Matches(0, name, "WORLD", true));
  EXPECT_TRUE(Matches(0, name, "World", true));
  EXPECT_TRUE(Matches(0, name, "hello", false, true));
  EXPECT_FALSE(Matches(0, name, "world", false, true));
  EXPECT_FALSE(Matches(1, name, "")) << "an empty text never matches";
  EXPECT_TRUE(Matches(0, name, "")) << "an empty needle is found in any text";
  EXPECT_FALSE(Matches(0, price, "e5")) << "a Float's text is not lower-cased";
  EXPECT_TRUE(Matches(0, price, "E5", true));
  EXPECT_FALSE(Matches(1, price, ""));
  EXPECT_TRUE(Matches(0, color, "RED"));
  EXPECT_TRUE(Matches(1, color, "no value"));
  EXPECT_TRUE(Matches(0, owner, "mck"));
}

TEST_F(FindTest, LinkedValuesUnder25BytesNeverMatch) {
  const int owner = t.Field(FieldType::Linked, "Owner");
  t.db.AppendRecord(testing::RawRecord({Bytes(24, 'a')}));
  EXPECT_FALSE(Matches(0, owner, "a"));
}

TEST_F(FindTest, CheckBoxDateAndTimeTexts) {
  const int done = t.Field(FieldType::CheckBox, "Done");
  const int due = t.Field(FieldType::Date, "Due");
  const int at = t.Field(FieldType::Time, "At");
  t.Add({Byte(done, 1), Num(due, 366), TimeVal(at, 13, 5, 9)});
  t.Add({Byte(done, 0), Num(due, 0), TimeVal(at, 255, 0, 0)});
  EXPECT_TRUE(Matches(0, done, "1"));
  EXPECT_FALSE(Matches(0, done, "0"));
  EXPECT_TRUE(Matches(1, done, "0"));
  EXPECT_FALSE(Matches(0, done, "11"));
  EXPECT_TRUE(Matches(0, due, "1/1/1905"));
  EXPECT_TRUE(Matches(1, due, "No Date", true));
  EXPECT_FALSE(Matches(1, due, "No Date")) << "the needle is folded, the date text is not";
  EXPECT_TRUE(Matches(0, at, "1:05:09 PM", true));
  EXPECT_TRUE(Matches(1, at, "No Time", true));
  t.locale.timeFormat = "HH:mm:ss";
  EXPECT_TRUE(Matches(0, at, "13:05"));
}

TEST_F(FindTest, CalculatedByResultFormat) {
  const int secs = t.Calc("Secs", 0, 2, 255, 255);
  const int day = t.Calc("Day", 0, 3, 255, 255);
  const int dec = t.Calc("Dec", 0, 0, 255, 255);
  const int odd = t.Calc("Odd", 0, 200, 255, 255);
  t.Add({Text(secs, "3725"), Text(day, "366"), Text(dec, "2.5000"), Text(odd, "1")});
  t.Add({Text(secs, ""), Text(dec, "")});
  EXPECT_TRUE(Matches(0, secs, "1:02:05"));
  EXPECT_FALSE(Matches(0, secs, "3725"));
  EXPECT_TRUE(Matches(0, day, "1/1/1905"));
  EXPECT_TRUE(Matches(0, dec, "2.5"));
  EXPECT_FALSE(Matches(0, odd, "1"));
  EXPECT_FALSE(Matches(1, secs, ""));
  EXPECT_FALSE(Matches(1, dec, ""));
}

TEST_F(FindTest, UnsearchableTypesAndMissingSlots) {
  const int photo = t.Field(FieldType::Image, "Photo");
  const int parts = t.Field(FieldType::Link, "Parts");
  const int name = t.Field(FieldType::Text, "Name");
  t.Add({Num(parts, 5), Text(name, "x")});
  t.db.AppendRecord(testing::RawRecord({Bytes{0}}));
  EXPECT_FALSE(Matches(0, photo, ""));
  EXPECT_FALSE(Matches(0, parts, "5"));
  EXPECT_FALSE(Matches(1, name, "x"));
}

TEST_F(FindTest, SearchAllFieldsStartsAtTheStartFieldOnlyInTheFirstRecord) {
  const int a = t.Field(FieldType::Text, "A");
  const int b = t.Field(FieldType::Text, "B");
  t.db.schema().field[a].width = 0;  // hidden: no list column
  t.Add({Text(a, "key"), Text(b, "key")});
  t.Add({Text(a, "key"), Text(b, "none")});
  SearchSettings search;
  search.text = "KEY";
  FindHit hit;
  EXPECT_EQ(FindRecord(t.db, search, 0, 0, &hit, nullptr, &t.ui, t.locale), 0);
  EXPECT_EQ(hit.field, a);
  EXPECT_EQ(hit.column, -1);
  EXPECT_EQ(FindRecord(t.db, search, 0, 1, &hit, nullptr, &t.ui, t.locale), 0);
  EXPECT_EQ(hit.field, b);
  EXPECT_EQ(hit.column, 0);
  EXPECT_EQ(FindRecord(t.db, search, 0, 2, &hit, nullptr, &t.ui, t.locale), 1);
  EXPECT_EQ(hit.field, a);
  search.field = b;
  EXPECT_EQ(FindRecord(t.db, search, 1, 0, &hit, nullptr, &t.ui, t.locale), -1);
  EXPECT_EQ(FindRecord(t.db, search, -5, 0, &hit, nullptr, nullptr, t.locale), 0);
  ASSERT_EQ(t.ui.messages.size(), 1u);
  EXPECT_EQ(t.ui.messages[0].text, "Not Found in Database!\n");
  EXPECT_EQ(t.ui.messages[0].caption, "ERROR!");
}

TEST_F(FindTest, OnlyRecordsInViewAreSearched) {
  const int name = t.Field(FieldType::Text, "Name");
  const int owner = t.Field(FieldType::Integer, "Owner");
  t.Add({Text(name, "match"), Num(owner, 1)});
  t.Add({Text(name, "match"), Num(owner, 2)});
  SearchSettings search;
  search.text = "match";
  LinkRestriction link{owner, 2};
  FindHit hit;
  EXPECT_EQ(FindRecord(t.db, search, 0, 0, &hit, &link, nullptr, t.locale), 1);
}

TEST_F(FindTest, RepeatNeverWrapsAround) {
  const int name = t.Field(FieldType::Text, "Name");
  for (const char* s : {"apple pie", "pear", "Apple juice", "plum"}) t.Add({Text(name, s)});
  t.db.ClearChanged();
  EXPECT_EQ(RepeatFind(t.session), -1) << "nothing stored to repeat";
  EXPECT_TRUE(t.ui.messages.empty());

  SearchSettings search;
  search.text = "APPLE";
  EXPECT_EQ(SearchDatabase(t.session, search), 0);
  EXPECT_TRUE(t.db.changed()) << "the search settings live in the database";
  EXPECT_EQ(LoadSearchSettings(t.db.schema()).text, "APPLE");
  EXPECT_EQ(RepeatFind(t.session), 2);
  EXPECT_EQ(t.session.found.index, 2);
  EXPECT_EQ(RepeatFind(t.session), -1);
  EXPECT_EQ(RepeatFind(t.session), -1) << "still after the last hit, not from the top";
  ASSERT_EQ(t.ui.messages.size(), 2u);
  EXPECT_EQ(t.ui.messages[1].text, "Not Found in Database!\n");
  EXPECT_EQ(t.session.found.index, 2);
}

}  // namespace
}  // namespace cx
