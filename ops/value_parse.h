// Reading date and time texts back into values, led by the same locale
// patterns that write them, so that what the list shows (and what export
// writes) reads back as the value it came from. Import, reports and field
// conversions use these.
#pragma once

#include <optional>
#include <string_view>

#include "engine/dates.h"
#include "platform/locale_info.h"

namespace cx {

// A date text in the short date pattern's order (month, day and year
// tokens, whatever separates the numbers; a text that starts with a
// four-digit year is read year, month, day). A year of one or two digits is
// read as 2000-2029 for 00-29 and 1930-1999 otherwise. Nothing for "NO
// DATE", an empty text, a text without three numbers, or a month or day
// out of range.
std::optional<CalendarDate> ParseDateText(std::string_view text, const LocaleInfo& locale);

// The day number of a date text; 0 (no date) when it does not read as a
// date from 1 January 1904 on.
uint32_t DateTextToDayNumber(std::string_view text, const LocaleInfo& locale);

struct ClockTime {
  int hours = 0;
  int minutes = 0;
  int seconds = 0;
  bool operator==(const ClockTime&) const = default;
};

// A time text in the time pattern's order (hours, minutes, optional
// seconds), with the AM/PM designators turning 12-hour readings into
// 0-23. Hours are not limited to a day (a calculated time may pass 24).
// Nothing for "No Time", an empty text or one without hours and minutes.
std::optional<ClockTime> ParseTimeText(std::string_view text, const LocaleInfo& locale);

}  // namespace cx
