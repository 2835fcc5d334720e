#include "engine/dates.h"

namespace cx {
namespace {

bool LeapIndex(int yearIndex) { return yearIndex % 4 == 0; }

}  // namespace

CalendarDate DayNumberToDate(uint32_t days) {
  // Year indexes count from 1900; the day number starts in year index 4.
  int64_t q = days / 365;
  int64_t r = days % 365;
  int64_t y = q + 4;
  int64_t d = r - (q + 3) / 4 + 1;
  if (d < 0) {
    y = q + 3;
    d = r - (q + 3) / 4 + 1 + 365;
    if ((q + 3) % 4 == 0) d += 1;
  }
  CalendarDate out;
  if (d == 0) {
    out.year = static_cast<int>(1900 + y - 1);
    out.month = 12;
    out.day = 31;
    return out;
  }
  static constexpr int kMonthDays[12] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  const int february = d > 59 && LeapIndex(static_cast<int>(y)) ? 29 : 28;
  int month = 0;
  while (month < 11) {
    int length = month == 1 ? february : kMonthDays[month];
    if (d - length <= 0) break;
    d -= length;
    ++month;
  }
  out.year = static_cast<int>(1900 + y);
  out.month = month + 1;
  out.day = static_cast<int>(d);
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
