// The small choosers that set one value: the date menu, the popup value
// menu, the check-box toggle, and the in-place edits of the list that use
// them. The widgets only show the menus and dialogs; what the entries are
// and what a choice writes is decided here.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "app/record_form.h"
#include "app/record_history.h"
#include "engine/dates.h"
#include "engine/record_store.h"
#include "ops/session.h"
#include "platform/clock.h"

namespace cx {

namespace picker_ids {
inline constexpr int kFirstEntry = 1300;
inline constexpr int kNoValue = 3001;
inline constexpr int kEditPopupList = 3002;
}  // namespace picker_ids

// Results of the date menu, in the order of its entries.
enum DateMenuResult {
  kDateDismissed = -1,
  kDateToday = 0,
  kDateTomorrow = 1,
  kDateOneWeek = 2,
  kDateNone = 3,
  kDateChoose = 4,
};
// "Today", "Tomorrow", "One Week", "No Date" and, when offered, "Choose Date".
std::vector<std::string> DateMenuEntries(bool offerChooseDate);

// The calendar dialog: shown at `initial`; gives the date picked, the
// no-date value (1904-01-01) for "No Date", or `initial` when cancelled.
// Nothing when it could not be shown.
using CalendarChooser = std::function<std::optional<CalendarDate>(const CalendarDate& initial)>;

// The day number a date menu result writes; nothing when nothing changes
// (dismissed). "Choose Date" opens the calendar at the stored date (at
// 1904-01-01 for no date), falling back to today when it cannot be shown.
std::optional<uint32_t> DayNumberForChoice(int result, uint32_t stored, const Clock& clock,
                                           const CalendarChooser& calendar);

// Popup value menu results: an index into the field's popup list, or one
// of these.
inline constexpr int kPopupDismissed = -1;
inline constexpr int kPopupNoValue = -2;
inline constexpr int kPopupEditList = -3;

struct PopupMenuEntry {
  int id = 0;  // 1300 upward for values, 3001 "No Value", 3002 "Edit Popup List"
  std::string text;
};
// The menu of field `field`: its popup values in the list's display order
// (sorted when the field's "Sort Popups" is on), then the extra entries.
std::vector<PopupMenuEntry> PopupMenuEntries(const Database& db, int field, bool offerNoValue,
                                             bool offerEditList);
// The chooser's result for the entry `id` the user picked (0 when the menu
// was dismissed): a value entry is mapped back to its index in the popup
// list by its text.
int PopupResultForEntry(const Database& db, int field, const std::vector<PopupMenuEntry>& entries,
                        int id);
// The byte a result writes: the index, or 254 for "No Value" (the chooser's
// own code, kept so); nothing for a dismissed menu.
std::optional<uint8_t> PopupByteForResult(int result);

// The check-box toggle: 1 from 0, 0 from anything else.
inline uint8_t ToggledCheck(uint8_t value) { return value == 0 ? 1 : 0; }

// The time dialog: shown at `initial` (hours 255 for no time); gives the
// time picked, or `initial` when cancelled. Nothing when it could not be
// shown (then the current time is taken).
using TimeChooser = std::function<std::optional<TimeBytes>(const TimeBytes& initial)>;
TimeBytes TimeForChooser(const TimeBytes& stored, const Clock& clock, const TimeChooser& chooser);

// In-place edits of one cell of the list, each through the common frame
// (the record written back where it stands, calculated fields and view
// following). 0 on success or when nothing changed, -1 when the record
// could not be read.
struct InPlaceTools {
  DataSession& session;
  const Clock& clock;
  RecordHistory* history = nullptr;
};
int ToggleCheckInPlace(const InPlaceTools& tools, size_t index, int field);
// `result` is the popup value menu's result for this cell.
int ChoosePopupInPlace(const InPlaceTools& tools, size_t index, int field, int result);
// `result` is the date menu's result; `calendar` serves "Choose Date".
int ChooseDateInPlace(const InPlaceTools& tools, size_t index, int field, int result,
                      const CalendarChooser& calendar);
int ChooseTimeInPlace(const InPlaceTools& tools, size_t index, int field, const TimeChooser& chooser);

// Which in-place edit a tap on a cell of this field type makes under the
// preferences, if any.
enum class InPlaceKind { None, Check, Popup, Date, Time };
struct InPlacePreferences {
  bool allowChecks = true;
  bool allowPopups = true;
  bool allowDateTime = true;
};
InPlaceKind InPlaceKindFor(FieldType type, const InPlacePreferences& prefs);

}  // namespace cx
