// Regional settings in the token form the value-text rules read: a short
// date pattern such as "M/d/yyyy" and a time pattern such as "h:mm:ss tt".
#pragma once

#include <string>

namespace cx {

struct LocaleInfo {
  std::string shortDate = "M/d/yyyy";
  char dateSeparator = '/';
  std::string timeFormat = "h:mm:ss tt";
  char timeSeparator = ':';
  std::string am = "AM";
  std::string pm = "PM";
  char decimalSeparator = '.';

  // The defaults above: a US-style handheld.
  static LocaleInfo UnitedStates() { return LocaleInfo(); }
};

// The first character of `pattern` that is not a letter, or `fallback`.
char FirstSeparator(const std::string& pattern, char fallback);

}  // namespace cx
