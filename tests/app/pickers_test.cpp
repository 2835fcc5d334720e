#include "app/pickers.h"

#include <gtest/gtest.h>

#include "ops/calc.h"
#include "ops/database_settings.h"
#include "ops/view.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Byte;
using testing::Num;
using testing::Text;
using testing::TestDb;
using T = FieldType;

// 2024-02-28 09:15:30 UTC: a leap year's February.
const FixedClock kLeapDay(1709111730);

TEST(DateMenu, ResultsCountFromTheClockWithEveryFourthYearALeapYear) {
  EXPECT_EQ(DateMenuEntries(true),
            (std::vector<std::string>{"Today", "Tomorrow", "One Week", "No Date", "Choose Date"}));
  EXPECT_EQ(DateMenuEntries(false).size(), 4u);

  const uint32_t today = DateToDayNumber({2024, 2, 28});
  EXPECT_EQ(DayNumberForChoice(kDateToday, 5, kLeapDay, {}), today);
  EXPECT_EQ(DayNumberForChoice(kDateTomorrow, 5, kLeapDay, {}), today + 1);
  EXPECT_EQ(DayNumberToDate(*DayNumberForChoice(kDateOneWeek, 5, kLeapDay, {})),
            (CalendarDate{2024, 3, 6}));
  EXPECT_EQ(DayNumberForChoice(kDateNone, 5, kLeapDay, {}), 0u);
  EXPECT_EQ(DayNumberForChoice(kDateDismissed, 5, kLeapDay, {}), std::nullopt);

  // The calendar opens at the stored date, 1904-01-01 for no date; a
  // calendar that cannot be shown gives today.
  CalendarDate shownAt;
  auto calendar = [&](const CalendarDate& initial) -> std::optional<CalendarDate> {
    shownAt = initial;
    return CalendarDate{2100, 3, 1};
  };
  EXPECT_EQ(DayNumberForChoice(kDateChoose, 0, kLeapDay, calendar), DateToDayNumber({2100, 3, 1}));
  EXPECT_EQ(shownAt, (CalendarDate{1904, 1, 1}));
  // No century rule: 2100 has a 29 February, so 1 March is two days after
  // 28 February.
  EXPECT_EQ(DateToDayNumber({2100, 3, 1}) - DateToDayNumber({2100, 2, 28}), 2u);
  EXPECT_EQ(DayNumberForChoice(kDateChoose, 366, kLeapDay, {}), today);
}

TEST(PopupMenu, EntriesInDisplayOrderMappedBackByText) {
  TestDb t;
  const int size = t.Field(T::Integer, "Size");
  t.db.popups()[size].items = {"10", "9", "100", "9"};
  auto plain = PopupMenuEntries(t.db, size, true, false);
  ASSERT_EQ(plain.size(), 5u);
  EXPECT_EQ(plain[0].id, 1300);
  EXPECT_EQ(plain[0].text, "10");
  EXPECT_EQ(plain[4].id, 3001);
  EXPECT_EQ(plain[4].text, "No Value");

  SetSortPopups(t.db.schema(), size, true);
  auto sorted = PopupMenuEntries(t.db, size, true, true);
  ASSERT_EQ(sorted.size(), 6u);
  EXPECT_EQ(sorted[0].text, "9");
  EXPECT_EQ(sorted[2].text, "10");
  EXPECT_EQ(sorted[3].text, "100");
  EXPECT_EQ(sorted[5].text, "Edit Popup List");
  // By text: either "9" entry maps to the first "9" of the list.
  EXPECT_EQ(PopupResultForEntry(t.db, size, sorted, sorted[1].id), 1);
  EXPECT_EQ(PopupResultForEntry(t.db, size, sorted, sorted[3].id), 2);
  EXPECT_EQ(PopupResultForEntry(t.db, size, sorted, 3001), kPopupNoValue);
  EXPECT_EQ(PopupResultForEntry(t.db, size, sorted, 3002), kPopupEditList);
  EXPECT_EQ(PopupResultForEntry(t.db, size, sorted, 0), kPopupDismissed);

  const int empty = t.Field(T::PopUp, "Empty");
  auto none = PopupMenuEntries(t.db, empty, true, false);
  ASSERT_EQ(none.size(), 1u);
  EXPECT_EQ(none[0].text, "No Value");

  EXPECT_EQ(PopupByteForResult(kPopupNoValue), 254);
  EXPECT_EQ(PopupByteForResult(3), 3);
  EXPECT_EQ(PopupByteForResult(kPopupDismissed), std::nullopt);
}

// Names sorted forward, a check box, a pop-up, a date, a time, and a
// calculated "check + 10".
struct Cells : TestDb {
  Cells() {
    name = Field(T::Text, "Name");
    check = Field(T::CheckBox, "Check");
    popup = Field(T::PopUp, "Popup");
    date = Field(T::Date, "Date");
    time = Field(T::Time, "Time");
    calc = Calc("Calc", 0, 1, check, 255, 0, "", "10");
    db.popups()[popup].items = {"low", "high"};
    db.schema().sortKey[0] = {static_cast<uint8_t>(name), 1};
    Add({Text(name, "a"), Byte(check, 2), Num(date, 500), testing::TimeVal(time, 255, 0, 0)});
    Add({Text(name, "b")});
    RecalculateFrom(session, 0);
    session.view = RebuildView(db);
    db.ClearChanged();
  }
  InPlaceTools Tools() { return InPlaceTools{session, kLeapDay, &history}; }
  int name, check, popup, date, time, calc;
  RecordHistory history;
};

TEST(InPlace, ToggleStoresZeroForAnyNonZeroByteAndRecalculates) {
  Cells t;
  ASSERT_EQ(t.TextAt(0, t.calc), "11");  // a check box counts as 0 or 1
  EXPECT_EQ(ToggleCheckInPlace(t.Tools(), 0, t.check), 0);
  EXPECT_EQ(FieldValue(t.db.record(0), t.check)->front(), 0);
  EXPECT_EQ(t.TextAt(0, t.calc), "10");
  EXPECT_EQ(ToggleCheckInPlace(t.Tools(), 0, t.check), 0);
  EXPECT_EQ(FieldValue(t.db.record(0), t.check)->front(), 1);
  EXPECT_TRUE(t.db.changed());
  EXPECT_EQ(ToggleCheckInPlace(t.Tools(), 7, t.check), -1);
}

TEST(InPlace, NoValueWritesTheChoosersCodeAndDismissingChangesNothing) {
  Cells t;
  EXPECT_EQ(ChoosePopupInPlace(t.Tools(), 1, t.popup, 1), 0);
  EXPECT_EQ(FieldValue(t.db.record(1), t.popup)->front(), 1);
  EXPECT_EQ(ChoosePopupInPlace(t.Tools(), 1, t.popup, kPopupNoValue), 0);
  EXPECT_EQ(FieldValue(t.db.record(1), t.popup)->front(), 254);
  t.db.ClearChanged();
  EXPECT_EQ(ChoosePopupInPlace(t.Tools(), 1, t.popup, kPopupDismissed), 0);
  EXPECT_FALSE(t.db.changed());
}

TEST(InPlace, CancelledDialogsLeaveTheStoredValue) {
  Cells t;
  const Bytes before(t.db.record(0).begin(), t.db.record(0).end());
  auto cancelledCalendar = [](const CalendarDate& initial) { return std::optional(initial); };
  auto cancelledClock = [](const TimeBytes& initial) { return std::optional(initial); };
  EXPECT_EQ(ChooseDateInPlace(t.Tools(), 0, t.date, kDateChoose, cancelledCalendar), 0);
  EXPECT_EQ(ChooseTimeInPlace(t.Tools(), 0, t.time, cancelledClock), 0);
  EXPECT_TRUE(std::ranges::equal(t.db.record(0), before));
  EXPECT_FALSE(t.db.changed());
  EXPECT_FALSE(t.history.CanUndo());

  // The time dialog starts at "No Time" for no time; one that cannot be
  // shown gives the current time.
  TimeBytes shownAt;
  auto noon = [&](const TimeBytes& initial) {
    shownAt = initial;
    return std::optional(TimeBytes{0, 0, 12, 0});
  };
  EXPECT_EQ(ChooseTimeInPlace(t.Tools(), 0, t.time, noon), 0);
  EXPECT_TRUE(shownAt.none());
  EXPECT_EQ(FieldValue(t.db.record(0), t.time)->subspan(0, 3)[2], 12);
  EXPECT_EQ(ChooseTimeInPlace(t.Tools(), 1, t.time, {}), 0);
  EXPECT_EQ((*FieldValue(t.db.record(1), t.time))[2], 9);
}

TEST(InPlace, EditedRecordStaysWhereItStandsAndUndoesInPlace) {
  Cells t;
  // A change that a sort would move: the record keeps its row until the
  // next sort.
  t.db.schema().sortKey[0] = {static_cast<uint8_t>(t.check), 1};
  ASSERT_EQ(ToggleCheckInPlace(t.Tools(), 1, t.check), 0);
  EXPECT_EQ(t.TextAt(1, t.name), "b");
  EXPECT_EQ(t.TextAt(1, t.calc), "11");
  ASSERT_TRUE(t.history.CanUndo());
  EXPECT_EQ(t.history.Undo(t.session), 1);
  EXPECT_EQ(t.TextAt(1, t.name), "b");
  EXPECT_EQ(FieldValue(t.db.record(1), t.check)->front(), 0);
  EXPECT_EQ(t.TextAt(1, t.calc), "10");
}

TEST(InPlace, EachKindNeedsItsPreference) {
  const InPlacePreferences on{true, true, true};
  const InPlacePreferences off{false, false, false};
  const std::vector<std::pair<T, InPlaceKind>> kinds = {
      {T::CheckBox, InPlaceKind::Check}, {T::PopUp, InPlaceKind::Popup},
      {T::Date, InPlaceKind::Date},      {T::Time, InPlaceKind::Time}};
  for (auto [type, kind] : kinds) {
    EXPECT_EQ(InPlaceKindFor(type, on), kind);
    EXPECT_EQ(InPlaceKindFor(type, off), InPlaceKind::None);
  }
  EXPECT_EQ(InPlaceKindFor(T::Date, {true, true, false}), InPlaceKind::None);
  EXPECT_EQ(InPlaceKindFor(T::CheckBox, {true, false, false}), InPlaceKind::Check);
  EXPECT_EQ(InPlaceKindFor(T::Text, on), InPlaceKind::None);
}

}  // namespace
}  // namespace cx
