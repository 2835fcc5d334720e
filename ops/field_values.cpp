#include "ops/field_values.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstring>

#include "engine/byte_order.h"

namespace cx {
namespace {

bool IsCSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

// from_chars leaves the value alone when it is out of range; the C
// conversion gives infinity for too large and 0 for too small.
double OutOfRange(std::string_view number, bool hex) {
  size_t e = number.find_first_of(hex ? "pP" : "eE");
  bool negativeExponent = e != std::string_view::npos && e + 1 < number.size() && number[e + 1] == '-';
  return negativeExponent ? 0.0 : HUGE_VAL;
}

}  // namespace

std::string LowerAscii(std::string_view text) {
  std::string out(text);
  for (char& c : out) c = LowerAscii(c);
  return out;
}

int CompareNoCase(std::string_view a, std::string_view b) {
  const size_t n = std::min(a.size(), b.size());
  for (size_t i = 0; i < n; ++i) {
    int ca = static_cast<unsigned char>(LowerAscii(a[i]));
    int cb = static_cast<unsigned char>(LowerAscii(b[i]));
    if (ca != cb) return ca - cb;
  }
  return a.size() < b.size() ? -1 : (a.size() > b.size() ? 1 : 0);
}

bool ContainsText(std::string_view haystack, std::string_view needle, bool beginsWith, bool foldHaystack) {
  if (!foldHaystack) {
    return beginsWith ? haystack.starts_with(needle) : haystack.find(needle) != std::string_view::npos;
  }
  if (needle.size() > haystack.size()) return false;
  const size_t last = beginsWith ? 0 : haystack.size() - needle.size();
  for (size_t at = 0; at <= last; ++at) {
    size_t k = 0;
    while (k < needle.size() && LowerAscii(haystack[at + k]) == needle[k]) ++k;
    if (k == needle.size()) return true;
  }
  return false;
}

double ParseDouble(std::string_view text) {
  size_t i = 0;
  while (i < text.size() && IsCSpace(text[i])) ++i;
  bool negative = false;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
  std::string_view rest = text.substr(i);
  // No number read means +0 whatever sign came before, as the C library
  // gives; a "-0" would show as "-0.0000" after a Min or Max.
  if (rest.empty() || rest[0] == '+' || rest[0] == '-') return 0.0;
  double value = 0.0;
  const bool hex = rest.size() >= 2 && rest[0] == '0' && (rest[1] == 'x' || rest[1] == 'X');
  const char* begin = rest.data() + (hex ? 2 : 0);
  const char* end = rest.data() + rest.size();
  auto result = std::from_chars(begin, end, value, hex ? std::chars_format::hex : std::chars_format::general);
  if (result.ec == std::errc::invalid_argument) {
    if (!hex) return 0.0;
    value = 0.0;  // "0x" with nothing after it still reads its "0"
  } else if (result.ec == std::errc::result_out_of_range) {
    value = OutOfRange(std::string_view(begin, static_cast<size_t>(result.ptr - begin)), hex);
  }
  return negative ? -value : value;
}

SlotValues AllSlotValues(ByteView record, int last) {
  SlotValues values;
  size_t off = DataStart(record);
  for (int i = 0; i <= last && i < format::kFieldCount; ++i) {
    if (off + 2 > record.size()) break;
    const size_t len = GetLE16(record.data() + off);
    if (len == format::kEndMark) break;
    const size_t at = off + 2;
    values[i] = record.subspan(at, std::min(len, record.size() - at));
    off = at + len;
  }
  return values;
}

std::string_view ValueView(ByteView value) {
  const char* p = reinterpret_cast<const char*>(value.data());
  const void* nul = value.empty() ? nullptr : std::memchr(p, 0, value.size());
  return std::string_view(p, nul ? static_cast<const char*>(nul) - p : value.size());
}

uint32_t Time24(ByteView value) {
  uint32_t t = 0;
  for (size_t i = 0; i < 3 && i < value.size(); ++i) t |= uint32_t(value[i]) << (8 * i);
  return t;
}

long TimeSeconds(uint8_t seconds, uint8_t minutes, uint8_t hours) {
  long h = hours == format::kNoTimeHours ? 0 : hours;
  return (h * 60 + minutes) * 60 + seconds;
}

std::optional<std::string_view> LinkedText(ByteView value) {
  constexpr size_t kBlock = 24;
  if (value.size() < kBlock + 1) return std::nullopt;
  return ValueView(value.subspan(kBlock));
}

CalcKind CalcKindOf(const FieldDef& field) {
  switch (field.resultFormat()) {
    case 0: case 4: case 5: case 6: return CalcKind::Decimal;
    case 1: return CalcKind::Whole;
    case 2: return CalcKind::Time;
    case 3: return CalcKind::Date;
    default: return CalcKind::Unknown;
  }
}

CalcOperand CalcOperand1(const FieldDef& field) {
  return {field.param1, (field.calcFlags & 1) != 0};
}

CalcOperand CalcOperand2(const FieldDef& field) {
  return {field.param2, (field.calcFlags & 2) != 0};
}

bool IsCalculated(const Schema& schema, int field) {
  return field >= 0 && field < format::kFieldCount &&
         schema.field[field].typeNumber == static_cast<int16_t>(FieldType::Calculated);
}

}  // namespace cx
