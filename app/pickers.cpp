#include "app/pickers.h"

#include "app/record_commit.h"
#include "design/popup_editor.h"
#include "engine/popups.h"
#include "ops/database_settings.h"

namespace cx {

std::vector<std::string> DateMenuEntries(bool offerChooseDate) {
  std::vector<std::string> entries{"Today", "Tomorrow", "One Week", "No Date"};
  if (offerChooseDate) entries.emplace_back("Choose Date");
  return entries;
}

std::optional<uint32_t> DayNumberForChoice(int result, uint32_t stored, const Clock& clock,
                                           const CalendarChooser& calendar) {
  const uint32_t today = TodayDayNumber(clock);
  switch (result) {
    case kDateToday:
      return today;
    case kDateTomorrow:
      return today + 1;
    case kDateOneWeek:
      return today + 7;
    case kDateNone:
      return 0;
    case kDateChoose: {
      const CalendarDate initial = DayNumberToDate(stored);
      std::optional<CalendarDate> picked = calendar ? calendar(initial) : std::nullopt;
      if (!picked) return today;
      return DateToDayNumber(*picked);
    }
    default:
      return std::nullopt;
  }
}

std::vector<PopupMenuEntry> PopupMenuEntries(const Database& db, int field, bool offerNoValue,
                                             bool offerEditList) {
  std::vector<PopupMenuEntry> entries;
  const auto& items = db.popups()[field].items;
  const size_t count = std::min<size_t>(items.size(), format::kMaxPopupItems);
  std::vector<std::string> texts;
  for (size_t i = 0; i < count; ++i) texts.push_back(items[i].substr(0, 80));
  const std::vector<int> order =
      PopupViewOrder(texts, db.schema().field[field].type(), SortPopupsOn(db.schema(), field));
  int id = picker_ids::kFirstEntry;
  for (int entry : order) entries.push_back({id++, texts[static_cast<size_t>(entry)]});
  if (offerNoValue) entries.push_back({picker_ids::kNoValue, "No Value"});
  if (offerEditList) entries.push_back({picker_ids::kEditPopupList, "Edit Popup List"});
  return entries;
}

int PopupResultForEntry(const Database& db, int field, const std::vector<PopupMenuEntry>& entries,
                        int id) {
  if (id == picker_ids::kNoValue) return kPopupNoValue;
  if (id == picker_ids::kEditPopupList) return kPopupEditList;
  for (const PopupMenuEntry& e : entries) {
    if (e.id != id) continue;
    const auto& items = db.popups()[field].items;
    for (size_t i = 0; i < items.size() && i < format::kMaxPopupItems; ++i) {
      if (items[i].substr(0, 80) == e.text) return static_cast<int>(i);
    }
  }
  return kPopupDismissed;
}

std::optional<uint8_t> PopupByteForResult(int result) {
  if (result >= 0 && result < 255) return static_cast<uint8_t>(result);
  if (result == kPopupNoValue) return static_cast<uint8_t>(254);
  return std::nullopt;
}

TimeBytes TimeForChooser(const TimeBytes& stored, const Clock& clock, const TimeChooser& chooser) {
  std::optional<TimeBytes> picked = chooser ? chooser(stored) : std::nullopt;
  if (!picked) return CurrentTime(clock);
  TimeBytes result = *picked;
  result.reserved = stored.reserved;  // carried as found
  return result;
}

int ToggleCheckInPlace(const InPlaceTools& tools, size_t index, int field) {
  return InPlaceEdit(
      tools.session, index, field, [&](RecordForm& f) { f.SetByte(field, ToggledCheck(f.Byte(field))); },
      tools.clock, tools.history);
}

int ChoosePopupInPlace(const InPlaceTools& tools, size_t index, int field, int result) {
  if (index >= tools.session.db.recordCount()) return -1;
  const std::optional<uint8_t> byte = PopupByteForResult(result);
  if (!byte) return 0;
  return InPlaceEdit(
      tools.session, index, field, [&](RecordForm& f) { f.SetByte(field, *byte); }, tools.clock,
      tools.history);
}

int ChooseDateInPlace(const InPlaceTools& tools, size_t index, int field, int result,
                      const CalendarChooser& calendar) {
  if (index >= tools.session.db.recordCount()) return -1;
  return InPlaceEdit(
      tools.session, index, field,
      [&](RecordForm& f) {
        if (auto day = DayNumberForChoice(result, f.Number(field), tools.clock, calendar)) {
          f.SetNumber(field, *day);
        }
      },
      tools.clock, tools.history);
}

int ChooseTimeInPlace(const InPlaceTools& tools, size_t index, int field, const TimeChooser& chooser) {
  if (index >= tools.session.db.recordCount()) return -1;
  return InPlaceEdit(
      tools.session, index, field,
      [&](RecordForm& f) { f.SetTime(field, TimeForChooser(f.Time(field), tools.clock, chooser)); },
      tools.clock, tools.history);
}

InPlaceKind InPlaceKindFor(FieldType type, const InPlacePreferences& prefs) {
  switch (type) {
    case FieldType::CheckBox:
      return prefs.allowChecks ? InPlaceKind::Check : InPlaceKind::None;
    case FieldType::PopUp:
      return prefs.allowPopups ? InPlaceKind::Popup : InPlaceKind::None;
    case FieldType::Date:
      return prefs.allowDateTime ? InPlaceKind::Date : InPlaceKind::None;
    case FieldType::Time:
      return prefs.allowDateTime ? InPlaceKind::Time : InPlaceKind::None;
    default:
      return InPlaceKind::None;
  }
}

}  // namespace cx
