// The display text of stored values: what the list shows and what export,
// reports and find compare. Dates and times follow the regional settings
// given.
#pragma once

#include <cstdint>
#include <string>

#include "engine/popups.h"
#include "engine/record.h"
#include "engine/schema.h"
#include "platform/locale_info.h"

namespace cx {

// Everything the formatters read besides the record itself.
struct ValueContext {
  const Schema& schema;
  const PopupLists& popups;
  const LocaleInfo& locale;
};

// The text of slot `fieldSlot` of a stored record. A slot the record does
// not contain gives an empty text (a Calculated one "Error!").
std::string ValueText(const ValueContext& ctx, ByteView record, int fieldSlot);
// The same for a value already found in its record (FieldValue, or one of
// FieldValues); nothing stands for a slot the record does not contain.
std::string ValueTextOf(const ValueContext& ctx, int fieldSlot, std::optional<ByteView> value);

// ValueTextOf for loops over many values: the date and time patterns are
// read once, and each text is appended to a buffer the caller reuses, so
// that exporting a large database allocates nothing per value.
class ValueTextWriter {
 public:
  explicit ValueTextWriter(const ValueContext& ctx);
  // Appends exactly what ValueTextOf(ctx, fieldSlot, value) returns.
  void Append(int fieldSlot, std::optional<ByteView> value, std::string& out) const;
  // True when the text of a value the record holds in slot `fieldSlot` is
  // its stored bytes up to the first zero byte, unchanged.
  bool ShowsStoredBytes(int fieldSlot) const;

  // A short date or time pattern cut into its parts.
  struct Layout {
    enum class Part : uint8_t { None, Month, Month2, Day, Day2, Year2, Year4,
                                Hour12, Hour12Two, Hour, Hour2, Minute2, Second2 };
    Part part[3] = {Part::None, Part::None, Part::None};
    size_t count = 0;
    char separator = '/';
    bool twelveHour = false;
  };

 private:
  const ValueContext ctx_;
  Layout date_;
  Layout time_;
};

// "NO DATE" for day 0, else the date in the short date pattern's order.
std::string DateText(uint32_t dayNumber, const LocaleInfo& locale);
// "No Time" when the hours byte is 255.
std::string TimeText(uint8_t seconds, uint8_t minutes, uint8_t hours, const LocaleInfo& locale);
// Seconds as "%d:%02d:%02d" (a calculated time result).
std::string SecondsText(long seconds);

// The number printed with `places` decimals in a field of 12, leading
// blanks removed, "." replaced by "," when the decimal separator is not ".".
std::string DecimalText(double value, int places, const LocaleInfo& locale);
// Decimal places of a Calculated field's result in `resultFormat`.
int ResultPlaces(uint8_t resultFormat);
// Decimal places of a number shown for `field`: a Calculated field's from
// its result format, other fields' from their size.
int DecimalPlaces(const FieldDef& field);

// One-line form (CR and LF become blanks) and edit-control form (every line
// break becomes CR LF) of a text.
std::string OneLine(const std::string& text);
std::string CrLfLines(const std::string& text);

}  // namespace cx
