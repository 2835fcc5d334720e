#include "engine/value_text.h"

#include <cctype>
#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <vector>

#include "engine/dates.h"

namespace cx {
namespace {

// Up to three tokens of a pattern cut at `separator`, as views into it.
struct PatternTokens {
  std::string_view token[3];
  size_t count = 0;
};

PatternTokens Tokens(std::string_view pattern, char separator) {
  PatternTokens t;
  size_t start = 0;
  while (t.count < 3 && start <= pattern.size()) {
    size_t end = pattern.find(separator, start);
    if (end == std::string_view::npos) {
      if (start < pattern.size()) t.token[t.count++] = pattern.substr(start);
      break;
    }
    t.token[t.count++] = pattern.substr(start, end - start);
    start = end + 1;
  }
  return t;
}

bool EqualsIgnoringCase(std::string_view a, std::string_view lower) {
  if (a.size() != lower.size()) return false;
  for (size_t i = 0; i < a.size(); ++i) {
    if (std::tolower(static_cast<unsigned char>(a[i])) != lower[i]) return false;
  }
  return true;
}

// "%d" (digits 1) or "%02d" (digits 2) of a value that is never negative.
void AppendNumber(std::string& out, long value, int digits) {
  char buf[24];
  int n = 0;
  unsigned long v = value < 0 ? 0 : static_cast<unsigned long>(value);
  do {
    buf[n++] = static_cast<char>('0' + v % 10);
    v /= 10;
  } while (v);
  while (n < digits) buf[n++] = '0';
  while (n) out.push_back(buf[--n]);
}

}  // namespace

std::string DateText(uint32_t dayNumber, const LocaleInfo& locale) {
  CalendarDate d = DayNumberToDate(dayNumber);
  if (d.month <= 1 && d.day <= 1 && d.year <= 1904) return "NO DATE";
  PatternTokens tokens = Tokens(locale.shortDate, locale.dateSeparator);
  std::string out;
  for (size_t i = 0; i < tokens.count; ++i) {
    if (i > 0) out.push_back(locale.dateSeparator);
    std::string_view t = tokens.token[i];
    if (EqualsIgnoringCase(t, "m")) {
      AppendNumber(out, d.month, 1);
    } else if (EqualsIgnoringCase(t, "mm") || EqualsIgnoringCase(t, "mmm")) {
      AppendNumber(out, d.month, 2);  // a number even for "mmm"
    } else if (EqualsIgnoringCase(t, "d")) {
      AppendNumber(out, d.day, 1);
    } else if (EqualsIgnoringCase(t, "dd")) {
      AppendNumber(out, d.day, 2);
    } else if (EqualsIgnoringCase(t, "yy")) {
      AppendNumber(out, d.year % 100, 2);
    } else if (EqualsIgnoringCase(t, "yyyy")) {
      AppendNumber(out, d.year, 4);
    }
  }
  return out;
}

std::string TimeText(uint8_t seconds, uint8_t minutes, uint8_t hours, const LocaleInfo& locale) {
  if (hours == format::kNoTimeHours) return "No Time";
  const bool twelve = locale.timeFormat.find("tt") != std::string::npos;
  const long h12 = hours == 0 ? 12 : (hours > 12 ? hours - 12 : hours);
  PatternTokens tokens = Tokens(locale.timeFormat, locale.timeSeparator);
  std::string out;
  for (size_t i = 0; i < tokens.count; ++i) {
    if (i > 0) out.push_back(locale.timeSeparator);
    std::string_view t = tokens.token[i];
    if (t == "h") {
      AppendNumber(out, twelve ? h12 : (hours == 0 ? 12 : long(hours)), 1);
    } else if (t == "hh") {
      AppendNumber(out, twelve ? h12 : long(hours), 2);
    } else if (t == "H") {
      AppendNumber(out, hours, 1);
    } else if (t == "HH") {
      AppendNumber(out, hours, 2);
    } else if (t == "mm") {
      AppendNumber(out, minutes, 2);
    } else if (t.find("ss") != std::string_view::npos) {
      AppendNumber(out, seconds, 2);
    }
  }
  if (twelve) {
    out.push_back(' ');
    out += hours < 12 ? locale.am : locale.pm;
  }
  return out;
}

std::string SecondsText(long seconds) {
  char buf[48];
  std::snprintf(buf, sizeof buf, "%ld:%02ld:%02ld", seconds / 3600, (seconds % 3600) / 60,
                seconds % 60);
  return buf;
}

std::string DecimalText(double value, int places, const LocaleInfo& locale) {
  // What "%12.Nf" prints, without its leading blanks: the exact decimal
  // value rounded to N places. to_chars gives the same digits, much faster.
  char buf[512];
  std::string out;
  auto r = std::to_chars(buf, buf + sizeof buf, value, std::chars_format::fixed, places);
  if (r.ec == std::errc()) {
    out.assign(buf, r.ptr);
  } else {
    char pattern[16];
    std::snprintf(pattern, sizeof pattern, "%%.%df", places);
    std::snprintf(buf, sizeof buf, pattern, value);
    out = buf;
  }
  if (locale.decimalSeparator != '.') {
    size_t dot = out.find('.');
    if (dot != std::string::npos) out[dot] = ',';
  }
  return out;
}

int DecimalPlaces(const FieldDef& field) {
  if (field.type() == FieldType::Calculated) {
    switch (field.resultFormat()) {
      case 0: return 4;
      case 4: return 3;
      case 5: return 2;
      case 6: return 1;
      default: return 0;
    }
  }
  return field.Places();
}

std::string ValueText(const ValueContext& ctx, ByteView record, int fieldSlot) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount) return "";
  return ValueTextOf(ctx, fieldSlot, FieldValue(record, fieldSlot));
}

std::string ValueTextOf(const ValueContext& ctx, int fieldSlot, std::optional<ByteView> value) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount) return "";
  const FieldDef& field = ctx.schema.field[fieldSlot];
  if (!value) return field.type() == FieldType::Calculated ? "Error!" : "";
  switch (field.type()) {
    case FieldType::NotUsed:
    case FieldType::Image:
    case FieldType::Heading:
      return "";
    case FieldType::Text:
    case FieldType::Float:
    case FieldType::Note:
    case FieldType::DBPopup:
      return ValueString(*value);
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Linked:
      return std::to_string(static_cast<int32_t>(ValueNumber(*value)));
    case FieldType::PopUp:
      return PopupText(ctx.popups[fieldSlot], value->empty() ? 0 : (*value)[0]);
    case FieldType::CheckBox:
      return !value->empty() && (*value)[0] != 0 ? "1" : "0";
    case FieldType::Date:
      return DateText(ValueNumber(*value), ctx.locale);
    case FieldType::Time: {
      uint8_t b[4] = {0, 0, 0, 0};
      for (size_t i = 0; i < value->size() && i < 4; ++i) b[i] = (*value)[i];
      return TimeText(b[0], b[1], b[2], ctx.locale);
    }
    case FieldType::Calculated: {
      std::string stored = ValueString(*value);
      switch (field.resultFormat()) {
        case 0: case 1: case 4: case 5: case 6:
          return stored;
        case 2:
          return SecondsText(std::strtol(stored.c_str(), nullptr, 10));
        case 3:
          return DateText(static_cast<uint32_t>(std::strtol(stored.c_str(), nullptr, 10)),
                          ctx.locale);
        default:
          return "Error!";
      }
    }
  }
  return "";
}

std::string OneLine(const std::string& text) {
  std::string out = text;
  for (char& c : out) {
    if (c == '\r' || c == '\n') c = ' ';
  }
  return out;
}

std::string CrLfLines(const std::string& text) {
  std::string out;
  out.reserve(text.size() + 8);
  for (size_t i = 0; i < text.size(); ++i) {
    char c = text[i];
    if (c == '\r' || c == '\n') {
      char other = c == '\r' ? '\n' : '\r';
      if (i + 1 < text.size() && text[i + 1] == other) ++i;
      out += "\r\n";
    } else {
      out.push_back(c);
    }
  }
  return out;
}

}  // namespace cx
