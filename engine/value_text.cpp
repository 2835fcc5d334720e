#include "engine/value_text.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
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

using Layout = ValueTextWriter::Layout;
using Part = Layout::Part;

Layout DateLayout(const LocaleInfo& locale) {
  Layout layout;
  layout.separator = locale.dateSeparator;
  PatternTokens tokens = Tokens(locale.shortDate, locale.dateSeparator);
  layout.count = tokens.count;
  for (size_t i = 0; i < tokens.count; ++i) {
    std::string_view t = tokens.token[i];
    Part& part = layout.part[i];
    if (EqualsIgnoringCase(t, "m")) {
      part = Part::Month;
    } else if (EqualsIgnoringCase(t, "mm") || EqualsIgnoringCase(t, "mmm")) {
      part = Part::Month2;  // a number even for "mmm"
    } else if (EqualsIgnoringCase(t, "d")) {
      part = Part::Day;
    } else if (EqualsIgnoringCase(t, "dd")) {
      part = Part::Day2;
    } else if (EqualsIgnoringCase(t, "yy")) {
      part = Part::Year2;
    } else if (EqualsIgnoringCase(t, "yyyy")) {
      part = Part::Year4;
    }
  }
  return layout;
}

Layout TimeLayout(const LocaleInfo& locale) {
  Layout layout;
  layout.separator = locale.timeSeparator;
  layout.twelveHour = locale.timeFormat.find("tt") != std::string::npos;
  PatternTokens tokens = Tokens(locale.timeFormat, locale.timeSeparator);
  layout.count = tokens.count;
  for (size_t i = 0; i < tokens.count; ++i) {
    std::string_view t = tokens.token[i];
    Part& part = layout.part[i];
    if (t == "h") {
      part = Part::Hour12;
    } else if (t == "hh") {
      part = Part::Hour12Two;
    } else if (t == "H") {
      part = Part::Hour;
    } else if (t == "HH") {
      part = Part::Hour2;
    } else if (t == "mm") {
      part = Part::Minute2;
    } else if (t.find("ss") != std::string_view::npos) {
      part = Part::Second2;
    }
  }
  return layout;
}

void AppendDate(uint32_t dayNumber, const Layout& layout, std::string& out) {
  CalendarDate d = DayNumberToDate(dayNumber);
  if (d.month <= 1 && d.day <= 1 && d.year <= 1904) {
    out += "NO DATE";
    return;
  }
  for (size_t i = 0; i < layout.count; ++i) {
    if (i > 0) out.push_back(layout.separator);
    switch (layout.part[i]) {
      case Part::Month: AppendNumber(out, d.month, 1); break;
      case Part::Month2: AppendNumber(out, d.month, 2); break;
      case Part::Day: AppendNumber(out, d.day, 1); break;
      case Part::Day2: AppendNumber(out, d.day, 2); break;
      case Part::Year2: AppendNumber(out, d.year % 100, 2); break;
      case Part::Year4: AppendNumber(out, d.year, 4); break;
      default: break;
    }
  }
}

void AppendTime(uint8_t seconds, uint8_t minutes, uint8_t hours, const Layout& layout,
                const LocaleInfo& locale, std::string& out) {
  if (hours == format::kNoTimeHours) {
    out += "No Time";
    return;
  }
  const bool twelve = layout.twelveHour;
  const long h12 = hours == 0 ? 12 : (hours > 12 ? hours - 12 : hours);
  for (size_t i = 0; i < layout.count; ++i) {
    if (i > 0) out.push_back(layout.separator);
    switch (layout.part[i]) {
      case Part::Hour12: AppendNumber(out, twelve ? h12 : (hours == 0 ? 12 : long(hours)), 1); break;
      case Part::Hour12Two: AppendNumber(out, twelve ? h12 : long(hours), 2); break;
      case Part::Hour: AppendNumber(out, hours, 1); break;
      case Part::Hour2: AppendNumber(out, hours, 2); break;
      case Part::Minute2: AppendNumber(out, minutes, 2); break;
      case Part::Second2: AppendNumber(out, seconds, 2); break;
      default: break;
    }
  }
  if (twelve) {
    out.push_back(' ');
    out += hours < 12 ? locale.am : locale.pm;
  }
}

}  // namespace

std::string DateText(uint32_t dayNumber, const LocaleInfo& locale) {
  std::string out;
  AppendDate(dayNumber, DateLayout(locale), out);
  return out;
}

std::string TimeText(uint8_t seconds, uint8_t minutes, uint8_t hours, const LocaleInfo& locale) {
  std::string out;
  AppendTime(seconds, minutes, hours, TimeLayout(locale), locale, out);
  return out;
}

std::string SecondsText(long seconds) {
  char buf[48];
  std::snprintf(buf, sizeof buf, "%ld:%02ld:%02ld", seconds / 3600, (seconds % 3600) / 60,
                seconds % 60);
  return buf;
}

namespace {

// The "%.Nf" digits of `value` worked out in integers, for up to four
// places: scaled by 10^N below 2^42 the product is within 2^-11 of the
// exact one, so unless it lies that close to halfway between two integers
// it rounds as the exact binary value does. False leaves the value to the
// general conversion (ties, large numbers, NaN).
bool FixedFromInteger(double value, int places, char* buf, char*& end) {
  static constexpr double kScale[] = {1, 10, 100, 1000, 10000};
  if (places < 0 || places > 4) return false;
  const double scaled = value * kScale[places];
  if (!(std::fabs(scaled) < 0x1p42)) return false;
  const double whole = std::nearbyint(scaled);
  if (std::fabs(scaled - whole) > 0.499) return false;
  // Room in front for the zeros that make 0.05 read "0.05".
  char digits[32];
  char* first = digits + 4;
  char* last = std::to_chars(first, digits + sizeof digits, static_cast<uint64_t>(std::fabs(whole))).ptr;
  while (last - first <= places) *--first = '0';
  char* out = buf;
  // A negative value keeps its sign even when it rounds to zero, as printf.
  if (std::signbit(value)) *out++ = '-';
  char* point = last - places;
  out = std::copy(first, point, out);
  if (places > 0) {
    *out++ = '.';
    out = std::copy(point, last, out);
  }
  end = out;
  return true;
}

}  // namespace

std::string DecimalText(double value, int places, const LocaleInfo& locale) {
  // What "%12.Nf" prints, without its leading blanks: the exact decimal
  // value rounded to N places. to_chars gives the same digits, much faster,
  // and most values need not even that.
  char buf[512];
  std::string out;
  char* end = nullptr;
  if (FixedFromInteger(value, places, buf, end)) {
    out.assign(buf, end);
  } else if (auto r = std::to_chars(buf, buf + sizeof buf, value, std::chars_format::fixed, places);
             r.ec == std::errc()) {
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

int ResultPlaces(uint8_t resultFormat) {
  switch (resultFormat) {
    case 0: return 4;
    case 4: return 3;
    case 5: return 2;
    case 6: return 1;
    default: return 0;
  }
}

int DecimalPlaces(const FieldDef& field) {
  return field.type() == FieldType::Calculated ? ResultPlaces(field.resultFormat()) : field.Places();
}

std::string ValueText(const ValueContext& ctx, ByteView record, int fieldSlot) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount) return "";
  return ValueTextOf(ctx, fieldSlot, FieldValue(record, fieldSlot));
}

namespace {

// The types and result formats whose text is the stored bytes up to their
// zero (kept in step with the switch of AppendValueText).
bool ShowsStored(const FieldDef& field) {
  switch (field.type()) {
    case FieldType::Text:
    case FieldType::Float:
    case FieldType::Note:
    case FieldType::DBPopup:
      return true;
    case FieldType::Calculated:
      switch (field.resultFormat()) {
        case 0: case 1: case 4: case 5: case 6: return true;
        default: return false;
      }
    default:
      return false;
  }
}

// The one formatter behind ValueTextOf and ValueTextWriter; a layout not
// given is read from the locale when a value needs it.
void AppendValueText(const ValueContext& ctx, int fieldSlot, std::optional<ByteView> value,
                     const Layout* date, const Layout* time, std::string& out) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount) return;
  const FieldDef& field = ctx.schema.field[fieldSlot];
  if (!value) {
    if (field.type() == FieldType::Calculated) out += "Error!";
    return;
  }
  auto appendStored = [&out](ByteView v) {
    const char* p = reinterpret_cast<const char*>(v.data());
    const void* nul = v.empty() ? nullptr : std::memchr(p, 0, v.size());
    out.append(p, nul ? static_cast<const char*>(nul) - p : v.size());
  };
  auto appendDate = [&](uint32_t dayNumber) {
    if (date) {
      AppendDate(dayNumber, *date, out);
    } else {
      AppendDate(dayNumber, DateLayout(ctx.locale), out);
    }
  };
  switch (field.type()) {
    case FieldType::NotUsed:
    case FieldType::Image:
    case FieldType::Heading:
      return;
    case FieldType::Text:
    case FieldType::Float:
    case FieldType::Note:
    case FieldType::DBPopup:
      appendStored(*value);
      return;
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Linked: {
      char buf[16];
      auto r = std::to_chars(buf, buf + sizeof buf, static_cast<int32_t>(ValueNumber(*value)));
      out.append(buf, r.ptr);
      return;
    }
    case FieldType::PopUp:
      out += PopupTextView(ctx.popups[fieldSlot], value->empty() ? 0 : (*value)[0]);
      return;
    case FieldType::CheckBox:
      out.push_back(!value->empty() && (*value)[0] != 0 ? '1' : '0');
      return;
    case FieldType::Date:
      appendDate(ValueNumber(*value));
      return;
    case FieldType::Time: {
      uint8_t b[4] = {0, 0, 0, 0};
      for (size_t i = 0; i < value->size() && i < 4; ++i) b[i] = (*value)[i];
      if (time) {
        AppendTime(b[0], b[1], b[2], *time, ctx.locale, out);
      } else {
        AppendTime(b[0], b[1], b[2], TimeLayout(ctx.locale), ctx.locale, out);
      }
      return;
    }
    case FieldType::Calculated: {
      switch (field.resultFormat()) {
        case 0: case 1: case 4: case 5: case 6:
          appendStored(*value);
          return;
        case 2:
        case 3: {
          const std::string stored = ValueString(*value);
          const long number = std::strtol(stored.c_str(), nullptr, 10);
          if (field.resultFormat() == 2) {
            out += SecondsText(number);
          } else {
            appendDate(static_cast<uint32_t>(number));
          }
          return;
        }
        default:
          out += "Error!";
          return;
      }
    }
  }
}

}  // namespace

std::string ValueTextOf(const ValueContext& ctx, int fieldSlot, std::optional<ByteView> value) {
  std::string out;
  AppendValueText(ctx, fieldSlot, value, nullptr, nullptr, out);
  return out;
}

ValueTextWriter::ValueTextWriter(const ValueContext& ctx)
    : ctx_(ctx), date_(DateLayout(ctx.locale)), time_(TimeLayout(ctx.locale)) {}

void ValueTextWriter::Append(int fieldSlot, std::optional<ByteView> value, std::string& out) const {
  AppendValueText(ctx_, fieldSlot, value, &date_, &time_, out);
}

bool ValueTextWriter::ShowsStoredBytes(int fieldSlot) const {
  return fieldSlot >= 0 && fieldSlot < format::kFieldCount && ShowsStored(ctx_.schema.field[fieldSlot]);
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
