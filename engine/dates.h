// Dates are day numbers counted from 1 January 1904 (day 0, which also
// means "no date"). Every fourth year is a leap year, with no century rule:
// files written on the handheld count that way, so this must too.
#pragma once

#include <cstdint>

namespace cx {

struct CalendarDate {
  int year = 1904;
  int month = 1;  // 1 to 12
  int day = 1;    // 1 to 31
  bool operator==(const CalendarDate&) const = default;
};

CalendarDate DayNumberToDate(uint32_t dayNumber);
// The inverse, for dates from 1 January 1904 on; earlier dates give 0.
uint32_t DateToDayNumber(const CalendarDate& date);

// Packed form: year - 1904 in bits 0-6, month in bits 7-10, day in 11-15.
uint16_t PackDate(const CalendarDate& date);
CalendarDate UnpackDate(uint16_t packed);

}  // namespace cx
