#include "ops/value_parse.h"

#include <cctype>
#include <string>
#include <vector>

namespace cx {
namespace {

struct Number {
  long value = 0;
  size_t digits = 0;
};

// The runs of digits in a text, in order (at most `limit`).
std::vector<Number> Numbers(std::string_view text, size_t limit) {
  std::vector<Number> out;
  size_t i = 0;
  while (i < text.size() && out.size() < limit) {
    if (!std::isdigit(static_cast<unsigned char>(text[i]))) {
      ++i;
      continue;
    }
    Number n;
    while (i < text.size() && std::isdigit(static_cast<unsigned char>(text[i]))) {
      if (n.value < 100000000) n.value = n.value * 10 + (text[i] - '0');
      ++n.digits;
      ++i;
    }
    out.push_back(n);
  }
  return out;
}

// The first letter of each of the pattern's three tokens, lower case;
// `skip` (the designator's "t") does not count.
std::vector<char> TokenLetters(const std::string& pattern, char separator, char skip = 0) {
  std::vector<char> letters;
  size_t start = 0;
  while (letters.size() < 3 && start <= pattern.size()) {
    size_t end = pattern.find(separator, start);
    std::string token = pattern.substr(start, end == std::string::npos ? end : end - start);
    char letter = 0;
    for (char c : token) {
      char lower = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
      if (std::isalpha(static_cast<unsigned char>(c)) && lower != skip) {
        letter = lower;
        break;
      }
    }
    letters.push_back(letter);
    if (end == std::string::npos) break;
    start = end + 1;
  }
  return letters;
}

bool ContainsNoCase(std::string_view text, std::string_view word) {
  if (word.empty() || word.size() > text.size()) return false;
  for (size_t i = 0; i + word.size() <= text.size(); ++i) {
    size_t k = 0;
    while (k < word.size() &&
           std::tolower(static_cast<unsigned char>(text[i + k])) ==
               std::tolower(static_cast<unsigned char>(word[k]))) {
      ++k;
    }
    if (k == word.size()) return true;
  }
  return false;
}

int MonthLength(int month, int year) {
  static constexpr int kDays[12] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  return month == 2 && year % 4 == 0 ? 29 : kDays[month - 1];
}

}  // namespace

std::optional<CalendarDate> ParseDateText(std::string_view text, const LocaleInfo& locale) {
  std::vector<Number> numbers = Numbers(text, 3);
  if (numbers.size() < 3) return std::nullopt;
  // Where month, day and year stand; a pattern that does not name each once
  // is read as month, day, year.
  int monthAt = 0, dayAt = 1, yearAt = 2;
  std::vector<char> letters = TokenLetters(locale.shortDate, locale.dateSeparator);
  if (letters.size() == 3) {
    int m = -1, d = -1, y = -1;
    for (int i = 0; i < 3; ++i) {
      if (letters[i] == 'm' && m < 0) m = i;
      else if (letters[i] == 'd' && d < 0) d = i;
      else if (letters[i] == 'y' && y < 0) y = i;
    }
    if (m >= 0 && d >= 0 && y >= 0) monthAt = m, dayAt = d, yearAt = y;
  }
  // A four-digit number first is a year whatever the pattern says: dates
  // written year-month-day (as spreadsheets often do) read as such.
  if (yearAt != 0 && numbers[0].digits == 4) monthAt = 1, dayAt = 2, yearAt = 0;
  CalendarDate date;
  date.month = static_cast<int>(numbers[monthAt].value);
  date.day = static_cast<int>(numbers[dayAt].value);
  const Number& year = numbers[yearAt];
  if (year.digits <= 2) {
    date.year = static_cast<int>(year.value < 30 ? 2000 + year.value : 1900 + year.value);
  } else {
    date.year = static_cast<int>(year.value);
  }
  if (date.month < 1 || date.month > 12 || date.day < 1 ||
      date.day > MonthLength(date.month, date.year)) {
    return std::nullopt;
  }
  return date;
}

uint32_t DateTextToDayNumber(std::string_view text, const LocaleInfo& locale) {
  std::optional<CalendarDate> date = ParseDateText(text, locale);
  return date ? DateToDayNumber(*date) : 0;
}

std::optional<ClockTime> ParseTimeText(std::string_view text, const LocaleInfo& locale) {
  std::vector<Number> numbers = Numbers(text, 3);
  if (numbers.size() < 2) return std::nullopt;
  int hoursAt = 0, minutesAt = 1, secondsAt = 2;
  std::vector<char> letters = TokenLetters(locale.timeFormat, locale.timeSeparator, 't');
  if (letters.size() >= 2) {
    int h = -1, m = -1, s = -1;
    for (int i = 0; i < static_cast<int>(letters.size()); ++i) {
      if (letters[i] == 'h' && h < 0) h = i;
      else if (letters[i] == 'm' && m < 0) m = i;
      else if (letters[i] == 's' && s < 0) s = i;
    }
    if (h >= 0 && m >= 0) {
      hoursAt = h;
      minutesAt = m;
      secondsAt = s >= 0 ? s : 3 - h - m;
    }
  }
  if (hoursAt >= static_cast<int>(numbers.size()) || minutesAt >= static_cast<int>(numbers.size())) {
    return std::nullopt;
  }
  ClockTime t;
  t.hours = static_cast<int>(numbers[hoursAt].value);
  t.minutes = static_cast<int>(numbers[minutesAt].value);
  if (secondsAt >= 0 && secondsAt < static_cast<int>(numbers.size())) {
    t.seconds = static_cast<int>(numbers[secondsAt].value);
  }
  // The designators may stand anywhere in the text (after the numbers as
  // written here, before them in some locales).
  const bool pm = ContainsNoCase(text, locale.pm);
  const bool am = !pm && ContainsNoCase(text, locale.am);
  if (pm && t.hours < 12) t.hours += 12;
  if (am && t.hours == 12) t.hours = 0;
  return t;
}

}  // namespace cx
