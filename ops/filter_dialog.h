// The "Edit Filters" dialog without its widgets: which controls a field's
// type shows, what the dialog opens with, and how its values are stored on
// OK.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

#include "engine/record_store.h"
#include "platform/locale_info.h"

namespace cx {

// The controls shown under a filter's "Select Field" list.
enum class FilterControls {
  None,          // the field's type has nothing to set
  MustContain,   // Text, Note, DB Popup, Linked: one text box
  WholeLimits,   // Integer, Unique, Calculated "Integer": two text boxes
  DecimalLimits, // Float, Calculated with decimals: two text boxes
  DateLimits,    // Date, Calculated "Date": two date pickers
  TimeLimits,    // Time, Calculated "Time": two time pickers
  PopupValue,    // Pop-Up: "Value Must Be" list of the entries
  CheckValue,    // Check-Box: "Value Must Be" check box
};
FilterControls FilterControlsFor(const Schema& schema, int field);

struct TimeOfDay {
  uint8_t hours = 0;
  uint8_t minutes = 0;
  uint8_t seconds = 0;
};

// The pop-up choice "No Value".
inline constexpr int kNoValueChoice = -1;
// What "No Value" stores for filter 1 and for filter 2. Filter 2's value
// never equals a stored byte, so a filter 2 on "No Value" matches nothing;
// files and users rely on that difference, so it is kept.
inline constexpr int32_t kNoValueFilter1 = 255;
inline constexpr int32_t kNoValueFilter2 = 597;

// One filter's controls.
struct FilterDialogFilter {
  bool enabled = false;     // "Filter n Enabled"
  int field = 0;            // "Select Field"
  bool notChecked = false;  // "NOT"
  std::string mustContain;
  std::string lowerLimit, upperLimit;  // typed texts
  uint32_t lowerDay = 0, upperDay = 0;
  TimeOfDay lowerTime, upperTime;
  int popupChoice = kNoValueChoice;  // entry index or kNoValueChoice
  bool checked = false;
};

struct FilterDialogValues {
  std::array<FilterDialogFilter, 2> filter;
  bool orBetween = false;  // "OR" checked (else "AND")
};

// The controls' values on opening, from the stored settings.
FilterDialogValues OpenFilterDialog(const Database& db);

// OK: stores what each filter's field type uses (other stored values stay),
// the switches, NOT flags and AND/OR, and marks the database changed. The
// caller then rebuilds the view.
void AcceptFilterDialog(Database& db, const FilterDialogValues& values);

// A filter's value written as one text, read by the controls that
// `field`'s type shows: the "Must Contain" text; "LOW..HIGH" for limits
// (whole or decimal numbers, or dates or times in `locale`'s patterns); a
// pop-up entry's text (case ignored when no entry matches exactly) or "No
// Value"; "1" or "0" for a check box. Sets `filter.field` and the controls
// of that type, leaving the others; false, with `error` saying why, when
// the text does not fit the type (the filter is then unchanged).
bool ReadFilterValueText(const Database& db, int field, std::string_view text, const LocaleInfo& locale,
                         FilterDialogFilter& filter, std::string& error);

// "Disable both filters".
void DisableBothFilters(Database& db);

}  // namespace cx
