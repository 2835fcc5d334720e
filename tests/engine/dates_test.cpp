#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>

#include "engine/dates.h"

namespace cx {

// Readable failure output (found by argument-dependent lookup).
static std::ostream& operator<<(std::ostream& os, const CalendarDate& d) {
  return os << d.year << '-' << d.month << '-' << d.day;
}

namespace {

using namespace std::chrono;

// Between 1904 and 2099 every fourth year is a leap year in the Gregorian
// calendar too, so the real calendar is the reference there.
TEST(DatesTest, AgreesWithTheCalendarEveryDayFrom1904To2099) {
  const sys_days base = sys_days{year{1904} / January / 1};
  const sys_days last = sys_days{year{2099} / December / 31};
  int failures = 0;
  for (sys_days day = base; day <= last && failures < 5; day += days{1}) {
    const auto n = static_cast<uint32_t>((day - base).count());
    const year_month_day ymd{day};
    const CalendarDate expected{int(ymd.year()), int(unsigned(ymd.month())), int(unsigned(ymd.day()))};
    const CalendarDate decoded = DayNumberToDate(n);
    const uint32_t encoded = DateToDayNumber(expected);
    if (!(decoded == expected) || encoded != n) {
      ++failures;
      ADD_FAILURE() << "day " << n << ": expected " << expected << ", decoded " << decoded
                    << ", encoded back as " << encoded;
    }
  }
  EXPECT_EQ(failures, 0);
}

TEST(DatesTest, FirstYearBoundaries) {
  EXPECT_EQ(DayNumberToDate(0), (CalendarDate{1904, 1, 1}));
  EXPECT_EQ(DayNumberToDate(365), (CalendarDate{1904, 12, 31}));
  EXPECT_EQ(DayNumberToDate(366), (CalendarDate{1905, 1, 1}));
  EXPECT_EQ(DateToDayNumber({1905, 1, 1}), 366u);
}

TEST(DatesTest, NoCenturyRuleAfter2099) {
  const uint32_t feb28 = DateToDayNumber({2100, 2, 28});
  EXPECT_EQ(DayNumberToDate(feb28 + 1), (CalendarDate{2100, 2, 29}));
  EXPECT_EQ(DateToDayNumber({2100, 3, 1}), feb28 + 2);
  // The two directions stay each other's inverse far beyond 2099.
  for (uint32_t n = feb28 - 400; n < feb28 + 40000; ++n) {
    ASSERT_EQ(DateToDayNumber(DayNumberToDate(n)), n) << DayNumberToDate(n);
  }
}

// Day numbers are unsigned 32-bit: every one of them is a real date, the
// day after the one before, however far past 2099 it lies.
TEST(DatesTest, EveryThirtyTwoBitDayIsTheDayAfterThePrevious) {
  EXPECT_EQ(DayNumberToDate(0xFFFFFFFFu), (CalendarDate{11760883, 8, 4}));
  auto next = [](CalendarDate d) {
    static constexpr int kLength[12] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    const int length = kLength[d.month - 1] + (d.month == 2 && d.year % 4 == 0 ? 1 : 0);
    if (++d.day > length) d.day = 1, ++d.month;
    if (d.month > 12) d.month = 1, ++d.year;
    return d;
  };
  // Windows spread over the range, the last one ending at the top.
  for (uint64_t start = 0; start <= 0xFFFFFFFFull; start += 0xFFFFFFFFull / 64) {
    const uint32_t first = static_cast<uint32_t>(std::min<uint64_t>(start, 0xFFFFFFFFull - 3000));
    CalendarDate expected = DayNumberToDate(first);
    ASSERT_EQ(DateToDayNumber(expected), first) << expected;
    for (uint32_t n = first + 1; n - first <= 3000; ++n) {
      expected = next(expected);
      ASSERT_EQ(DayNumberToDate(n), expected) << "day " << n;
    }
  }
}

TEST(DatesTest, DatesBeforeTheBaseGiveZero) {
  EXPECT_EQ(DateToDayNumber({1903, 12, 31}), 0u);
  EXPECT_EQ(DateToDayNumber({1800, 6, 1}), 0u);
}

TEST(DatesTest, PackedForm) {
  // Year index in bits 0-6, month in 7-10, day in 11-15.
  EXPECT_EQ(PackDate({2005, 3, 17}), 0x89E5);
  EXPECT_EQ(UnpackDate(0x89E5), (CalendarDate{2005, 3, 17}));
  EXPECT_EQ(PackDate({1904, 1, 1}), 0x0880);
  for (int y = 1904; y <= 2031; ++y) {
    for (int m = 1; m <= 12; ++m) {
      const CalendarDate d{y, m, 31 - m};
      ASSERT_EQ(UnpackDate(PackDate(d)), d);
    }
  }
}

}  // namespace
}  // namespace cx
