#include "engine/dates.h"

namespace cx {
CalendarDate DayNumberToDate(uint32_t days) {
  // Whole four-year cycles first (each starts with its leap year), so the
  // arithmetic stays exact for every 32-bit day number.
  constexpr uint32_t kCycle = 4 * 365 + 1;
  uint32_t rest = days % kCycle;
  int64_t year = 1904 + int64_t{4} * (days / kCycle);
  bool leap = true;
  while (rest >= (leap ? 366u : 365u)) {
    rest -= leap ? 366u : 365u;
    ++year;
    leap = false;
  }
  static constexpr int kMonthDays[12] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  int month = 0;
  for (;;) {
    const uint32_t length = static_cast<uint32_t>(kMonthDays[month] + (month == 1 && leap ? 1 : 0));
    if (rest < length || month == 11) break;
    rest -= length;
    ++month;
  }
  CalendarDate out;
  out.year = static_cast<int>(year);
  out.month = month + 1;
  out.day = static_cast<int>(rest) + 1;
  return out;
}

uint32_t DateToDayNumber(const CalendarDate& date) {
  if (date.year < 1904) return 0;
  int64_t years = date.year - 1904;
  int64_t days = years * 365 + (years + 3) / 4;  // leap days of the years before
  static constexpr int kMonthDays[12] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  for (int m = 1; m < date.month && m <= 12; ++m) {
    days += kMonthDays[m - 1];
    if (m == 2 && date.year % 4 == 0) days += 1;
  }
  days += date.day - 1;
  return days < 0 ? 0 : static_cast<uint32_t>(days);
}

uint16_t PackDate(const CalendarDate& date) {
  return static_cast<uint16_t>(((date.year - 1904) & 0x7F) | ((date.month & 0x0F) << 7) |
                               ((date.day & 0x1F) << 11));
}

CalendarDate UnpackDate(uint16_t packed) {
  CalendarDate d;
  d.year = 1904 + (packed & 0x7F);
  d.month = (packed >> 7) & 0x0F;
  d.day = (packed >> 11) & 0x1F;
  return d;
}

}  // namespace cx
