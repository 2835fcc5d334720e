#include "ops/filter_dialog.h"

#include <charconv>
#include <cstdint>

#include "engine/field_types.h"
#include "ops/database_settings.h"
#include "ops/field_values.h"
#include "ops/value_parse.h"

namespace cx {
namespace {

TimeOfDay TimeFrom24(uint32_t t) {
  return {static_cast<uint8_t>(t >> 16), static_cast<uint8_t>(t >> 8), static_cast<uint8_t>(t)};
}

// A text box's contents end in a zero inside the 40 stored bytes.
constexpr size_t kFilterTextMax = 39;

std::string Quote(std::string_view text) { return "\"" + std::string(text) + "\""; }

bool SplitLimits(std::string_view text, std::string_view& low, std::string_view& high, std::string& error) {
  const size_t at = text.find("..");
  if (at == std::string_view::npos || at == 0 || at + 2 >= text.size()) {
    error = "Limits are written LOW..HIGH, not " + Quote(text);
    return false;
  }
  low = text.substr(0, at);
  high = text.substr(at + 2);
  return true;
}

bool WholeNumber(std::string_view text, std::string& error) {
  int32_t value = 0;
  const char* end = text.data() + text.size();
  auto [ptr, ec] = std::from_chars(text.data(), end, value);
  if (ec != std::errc() || ptr != end) {
    error = Quote(text) + " is not a whole number from -2147483648 to 2147483647";
    return false;
  }
  return true;
}

// Decimal limits are kept as typed and read back with the C library's
// conversion, which knows only "." as the point; so the whole text must be
// a number in that form, or the stored limit would mean something else.
bool DecimalNumber(std::string_view text, std::string& error) {
  double value = 0;
  const char* end = text.data() + text.size();
  auto [ptr, ec] = std::from_chars(text.data(), end, value);
  if (ec != std::errc() || ptr != end) {
    error = Quote(text) + " is not a decimal number (with \".\" as the point)";
    return false;
  }
  if (text.size() > kFilterTextMax) {
    error = Quote(text) + " is longer than " + std::to_string(kFilterTextMax) + " characters";
    return false;
  }
  return true;
}

bool DayOf(std::string_view text, const LocaleInfo& locale, uint32_t& day, std::string& error) {
  std::optional<CalendarDate> date = ParseDateText(text, locale);
  day = date ? DateToDayNumber(*date) : 0;
  if (day == 0) {
    error = Quote(text) + " is not a date from 1904 on in the pattern " + locale.shortDate;
    return false;
  }
  return true;
}

// A time picker offers the hours of one day.
bool TimeOf(std::string_view text, const LocaleInfo& locale, TimeOfDay& time, std::string& error) {
  std::optional<ClockTime> t = ParseTimeText(text, locale);
  if (!t || t->hours < 0 || t->hours > 23 || t->minutes < 0 || t->minutes > 59 || t->seconds < 0 ||
      t->seconds > 59) {
    error = Quote(text) + " is not a time of day in the pattern " + locale.timeFormat;
    return false;
  }
  time = {static_cast<uint8_t>(t->hours), static_cast<uint8_t>(t->minutes), static_cast<uint8_t>(t->seconds)};
  return true;
}

bool PopupChoiceOf(const Database& db, int field, std::string_view text, int& choice, std::string& error) {
  if (text == "No Value") {
    choice = kNoValueChoice;
    return true;
  }
  const std::vector<std::string>& items = db.popups()[field].items;
  for (bool exact : {true, false}) {
    for (size_t i = 0; i < items.size(); ++i) {
      if (exact ? items[i] == text : CompareNoCase(items[i], text) == 0) {
        choice = static_cast<int>(i);
        return true;
      }
    }
  }
  error = "No entry " + Quote(text) + " in the popup list of " + Quote(db.schema().field[field].name.str());
  return false;
}

}  // namespace

FilterControls FilterControlsFor(const Schema& schema, int field) {
  if (field < 0 || field >= format::kFieldCount) return FilterControls::None;
  const FieldDef& def = schema.field[field];
  switch (def.type()) {
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
    case FieldType::Linked:
      return FilterControls::MustContain;
    case FieldType::Integer:
    case FieldType::Unique:
      return FilterControls::WholeLimits;
    case FieldType::Float:
      return FilterControls::DecimalLimits;
    case FieldType::Date:
      return FilterControls::DateLimits;
    case FieldType::Time:
      return FilterControls::TimeLimits;
    case FieldType::PopUp:
      return FilterControls::PopupValue;
    case FieldType::CheckBox:
      return FilterControls::CheckValue;
    case FieldType::Calculated:
      switch (CalcKindOf(def)) {
        case CalcKind::Decimal: return FilterControls::DecimalLimits;
        case CalcKind::Whole: return FilterControls::WholeLimits;
        case CalcKind::Time: return FilterControls::TimeLimits;
        case CalcKind::Date: return FilterControls::DateLimits;
        case CalcKind::Unknown: return FilterControls::None;
      }
      return FilterControls::None;
    default:
      return FilterControls::None;
  }
}

FilterDialogValues OpenFilterDialog(const Database& db) {
  const FilterSettings settings = LoadFilterSettings(db.schema());
  FilterDialogValues values;
  values.orBetween = settings.UsesOr();
  for (int n = 0; n < 2; ++n) {
    const Filter& f = settings.filter[n];
    FilterDialogFilter& d = values.filter[n];
    d.enabled = f.enabled;
    d.field = f.field;
    d.notChecked = settings.Not(n);
    d.mustContain = f.LowerText();
    if (FilterControlsFor(db.schema(), f.field) == FilterControls::WholeLimits) {
      d.lowerLimit = std::to_string(f.lowerNumber);
      d.upperLimit = std::to_string(f.upperNumber);
    } else {
      d.lowerLimit = f.LowerText();
      d.upperLimit = f.UpperText();
    }
    d.lowerDay = f.LowerDay();
    d.upperDay = f.UpperDay();
    d.lowerTime = TimeFrom24(f.LowerTime());
    d.upperTime = TimeFrom24(f.UpperTime());
    const bool noValue = f.lowerNumber == kNoValueFilter1 || f.lowerNumber == kNoValueFilter2;
    d.popupChoice = noValue ? kNoValueChoice : f.lowerNumber;
    d.checked = f.lowerNumber != 0;
  }
  return values;
}

void AcceptFilterDialog(Database& db, const FilterDialogValues& values) {
  FilterSettings settings = LoadFilterSettings(db.schema());
  settings.combination = 0;
  if (values.orBetween) settings.combination |= kFilterOr;
  for (int n = 0; n < 2; ++n) {
    const FilterDialogFilter& d = values.filter[n];
    Filter& f = settings.filter[n];
    f.enabled = d.enabled;
    f.field = d.field;
    if (d.notChecked) settings.combination |= n == 0 ? kFilterNot1 : kFilterNot2;
    switch (FilterControlsFor(db.schema(), d.field)) {
      case FilterControls::MustContain:
        f.SetLowerText(d.mustContain);
        break;
      case FilterControls::WholeLimits:
        f.lowerNumber = ParseLong(d.lowerLimit);
        f.upperNumber = ParseLong(d.upperLimit);
        break;
      case FilterControls::DecimalLimits:
        f.SetLowerText(d.lowerLimit);
        f.SetUpperText(d.upperLimit);
        break;
      case FilterControls::DateLimits:
        f.SetLowerDay(d.lowerDay);
        f.SetUpperDay(d.upperDay);
        break;
      case FilterControls::TimeLimits:
        f.SetLowerTime(d.lowerTime.hours, d.lowerTime.minutes, d.lowerTime.seconds);
        f.SetUpperTime(d.upperTime.hours, d.upperTime.minutes, d.upperTime.seconds);
        break;
      case FilterControls::PopupValue:
        f.lowerNumber = d.popupChoice == kNoValueChoice || d.popupChoice == kNoValueFilter1
                            ? (n == 0 ? kNoValueFilter1 : kNoValueFilter2)
                            : d.popupChoice;
        break;
      case FilterControls::CheckValue:
        f.lowerNumber = d.checked ? 1 : 0;
        break;
      case FilterControls::None:
        break;
    }
  }
  StoreFilterSettings(settings, db.schema());
  db.MarkChanged();
}

bool ReadFilterValueText(const Database& db, int field, std::string_view text, const LocaleInfo& locale,
                         FilterDialogFilter& filter, std::string& error) {
  FilterDialogFilter f = filter;
  f.field = field;
  std::string_view low, high;
  switch (FilterControlsFor(db.schema(), field)) {
    case FilterControls::MustContain:
      if (text.size() > kFilterTextMax) {
        error = Quote(text) + " is longer than " + std::to_string(kFilterTextMax) + " characters";
        return false;
      }
      f.mustContain = std::string(text);
      break;
    case FilterControls::WholeLimits:
      if (!SplitLimits(text, low, high, error) || !WholeNumber(low, error) || !WholeNumber(high, error)) {
        return false;
      }
      f.lowerLimit = std::string(low);
      f.upperLimit = std::string(high);
      break;
    case FilterControls::DecimalLimits:
      if (!SplitLimits(text, low, high, error) || !DecimalNumber(low, error) || !DecimalNumber(high, error)) {
        return false;
      }
      f.lowerLimit = std::string(low);
      f.upperLimit = std::string(high);
      break;
    case FilterControls::DateLimits:
      if (!SplitLimits(text, low, high, error) || !DayOf(low, locale, f.lowerDay, error) ||
          !DayOf(high, locale, f.upperDay, error)) {
        return false;
      }
      break;
    case FilterControls::TimeLimits:
      if (!SplitLimits(text, low, high, error) || !TimeOf(low, locale, f.lowerTime, error) ||
          !TimeOf(high, locale, f.upperTime, error)) {
        return false;
      }
      break;
    case FilterControls::PopupValue:
      if (!PopupChoiceOf(db, field, text, f.popupChoice, error)) return false;
      break;
    case FilterControls::CheckValue:
      if (text != "0" && text != "1") {
        error = "A check box filter takes 1 (checked) or 0 (not checked), not " + Quote(text);
        return false;
      }
      f.checked = text == "1";
      break;
    case FilterControls::None:
      error = "A field of type " + std::string(FieldTypeLabel(db.schema().field[field].type())) +
              " has no value to filter on";
      return false;
  }
  filter = f;
  return true;
}

void DisableBothFilters(Database& db) {
  FilterSettings settings = LoadFilterSettings(db.schema());
  settings.filter[0].enabled = false;
  settings.filter[1].enabled = false;
  StoreFilterSettings(settings, db.schema());
  db.MarkChanged();
}

}  // namespace cx
