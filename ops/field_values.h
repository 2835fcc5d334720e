// Readers of stored values shared by sorting, the view test, find and
// calculation. They read the value bytes of one slot (engine/record.h
// FieldValue) and never allocate unless they return a string.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "engine/record.h"
#include "engine/schema.h"

namespace cx {

// Only A-Z are folded: files hold Windows-1252 text and the handheld's C
// library lower-cased nothing else, so neither does comparison or find.
inline char LowerAscii(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; }
std::string LowerAscii(std::string_view text);

// Three-way comparison ignoring case, byte by byte as unsigned bytes, as the
// C library's case-insensitive comparison does. Only the sign matters.
int CompareNoCase(std::string_view a, std::string_view b);

// True when `needle` occurs in `haystack` (at its start when `beginsWith`).
// With `foldHaystack` the haystack's letters count as lower case; the
// needle is taken as it is.
bool ContainsText(std::string_view haystack, std::string_view needle, bool beginsWith,
                  bool foldHaystack = false);

// Decimal text to double as the C library's conversion reads it: leading
// blanks, optional sign, digits with an optional point and exponent (also
// "inf", "nan" and hexadecimal); it stops at anything else and no number
// gives 0. The process locale plays no part: "," never counts as a point.
double ParseDouble(std::string_view text);

// The value of every slot of a record, found in one walk: entry i is what
// FieldValue(record, i) gives.
using SlotValues = std::array<std::optional<ByteView>, format::kFieldCount>;
// Slots after `last` are left without a value, unread.
SlotValues AllSlotValues(ByteView record, int last = format::kFieldCount - 1);

// The text of a value up to its NUL (or the end of the value).
std::string_view ValueView(ByteView value);

// A Time value's three bytes (seconds, minutes, hours) as one 24-bit
// number, seconds in the low byte. Missing bytes read as zero.
uint32_t Time24(ByteView value);
// Seconds since midnight of a 3-byte time; hour 255 ("No Time") counts as 0.
long TimeSeconds(uint8_t seconds, uint8_t minutes, uint8_t hours);

// A Linked value's text (from byte 24), or nothing when the value is
// shorter than 25 bytes.
std::optional<std::string_view> LinkedText(ByteView value);

// How a Calculated field's result is treated by filters, find and sorting.
enum class CalcKind { Decimal, Whole, Time, Date, Unknown };
CalcKind CalcKindOf(const FieldDef& field);

// A Calculated field's operands: the slot (255 = a constant) and whether
// it is taken from the previous record in view.
struct CalcOperand {
  int field = 255;
  bool fromPrevious = false;
  bool IsField() const { return field != 255; }
};
CalcOperand CalcOperand1(const FieldDef& field);
CalcOperand CalcOperand2(const FieldDef& field);

bool IsCalculated(const Schema& schema, int field);

}  // namespace cx
