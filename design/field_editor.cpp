#include "design/field_editor.h"

#include <algorithm>
#include <climits>
#include <cstring>

#include "design/field_controls.h"
#include "design/recalculate.h"
#include "engine/container.h"
#include "engine/record.h"

namespace cx {
namespace {

constexpr int kMaxLength = 254;
constexpr int kMaxWidth = 160;
constexpr int kConstantChars = 8;
// The two constants share the text slot: value 1's at byte 0, value 2's at
// byte 9; byte 19 holds the result format.
constexpr size_t kConstant2At = 9;

int PopupCount(const Database& db, int slot) {
  return static_cast<int>(std::min<size_t>(db.popups()[slot].items.size(), format::kMaxPopupItems));
}

// A list entry naming a field (1 to 30) from a stored slot byte; anything
// that is not a slot shows as "No Field".
int FieldEntryFromByte(uint8_t slot) { return slot < format::kFieldCount ? slot + 1 : 0; }
uint8_t ByteFromFieldEntry(int entry) {
  return entry >= 1 && entry <= format::kFieldCount ? static_cast<uint8_t>(entry - 1) : 255;
}

// A constant written without clearing what follows its NUL in the slot.
void WriteConstant(FieldDef& f, size_t at, const std::string& text) {
  const size_t n = std::min<size_t>(text.size(), kConstantChars);
  std::memcpy(f.text.bytes.data() + at, text.data(), n);
  f.text.bytes[at + n] = 0;
}

}  // namespace

std::string FieldEditorTitle(int slot) { return "Edit Field " + std::to_string(slot + 1); }
std::string FieldNameLabel(int slot) { return "Field " + std::to_string(slot + 1) + " Name"; }

std::vector<std::string> FieldChoiceList(const Schema& schema) {
  std::vector<std::string> out{std::string(kNoField)};
  for (const FieldDef& f : schema.field) out.push_back(f.name.str());
  return out;
}

std::vector<std::string> DefaultValueList(const Database& db, int slot) {
  const auto& items = db.popups()[slot].items;
  std::vector<std::string> out;
  for (int i = 0; i < PopupCount(db, slot); ++i) out.push_back(items[i].substr(0, format::kMaxPopupText));
  out.emplace_back(kNoValue);
  return out;
}

int ReadNumberEdit(std::string_view text) { return ParseLong(text); }

int StoredWidthFromPixels(int pixels) {
  const int width = static_cast<int>(pixels * 0.6666666666666666);
  return std::clamp(width, 0, kMaxWidth);
}

int PixelsFromStoredWidth(int width) { return static_cast<int>(width * 1.5); }

FieldSettings LoadFieldSettings(const Database& db, int slot) {
  const FieldDef& f = db.schema().field[slot];
  FieldSettings s;
  s.name = f.name.str();
  s.type = f.typeNumber >= 0 && f.typeNumber < kFieldTypeCount ? f.typeNumber : -1;
  s.maxCharacters = f.size;
  s.places = f.Places();
  s.pixelsShown = PixelsFromStoredWidth(f.width);
  s.visible = f.visible != 0;
  s.exportPrint = f.exportPrint != 0;
  s.popupsAppend = f.popupsAppend != 0;
  const int count = PopupCount(db, slot);
  s.defaultValue = f.param1 < count ? f.param1 : count;
  s.behavior = f.behavior;

  const FieldType type = f.type();
  if (type == FieldType::Link || type == FieldType::Linked || type == FieldType::DBPopup) {
    s.otherDatabase = f.text.str();
    s.otherFieldNumber = f.otherField + 1;
    if (type == FieldType::DBPopup) s.group = f.param3;
    if (type == FieldType::Link) s.showValueFrom = FieldEntryFromByte(f.param1);
  }
  if (type == FieldType::Calculated) {
    s.value1 = FieldEntryFromByte(f.param1);
    if (f.param1 == 255) {
      s.constant1 = f.Constant1();
    } else {
      s.prevRecord1 = (f.calcFlags & 1) != 0;
    }
    s.value2 = FieldEntryFromByte(f.param2);
    if (f.param2 == 255) {
      s.constant2 = f.Constant2();
    } else {
      s.prevRecord2 = (f.calcFlags & 2) != 0;
    }
    s.operation = f.calcOperation < kCalcOperations.size() ? f.calcOperation : 0;
    s.resultFormat = f.resultFormat() < kResultFormats.size() ? f.resultFormat() : 0;
  }
  return s;
}

void ChooseFieldType(FieldSettings& settings, int previousType, const Database& db, int slot) {
  const FieldType now = TypeFromNumber(settings.type);
  const FieldType before = TypeFromNumber(previousType);
  if (now == FieldType::PopUp && before != FieldType::PopUp) {
    settings.defaultValue = PopupCount(db, slot);  // "No Value"
  }
  if (now == FieldType::Note && before != FieldType::Note) settings.popupsAppend = false;
  if (before == FieldType::Note &&
      (now == FieldType::Text || now == FieldType::Integer || now == FieldType::Float ||
       now == FieldType::DBPopup)) {
    settings.popupsAppend = false;
  }
}

bool PickOtherDatabase(const std::string& path, FieldSettings& settings) {
  Header header;
  if (ReadHeader(path, header) != 1) return false;
  settings.otherDatabase = header.Name();
  return true;
}

TypeChange PendingTypeChange(const Database& db, int slot, int newType) {
  const FieldDef& f = db.schema().field[slot];
  if (newType == f.typeNumber || db.recordCount() == 0) return TypeChange::Keep;
  return ClassifyTypeChange(f.type(), TypeFromNumber(newType));
}

FieldApplyOutcome ApplyFieldSettings(DataSession& session, int slot, const FieldSettings& settings) {
  Database& db = session.db;
  FieldApplyOutcome outcome;
  if (settings.type < 0 || settings.type >= kFieldTypeCount) {
    outcome.result = ApplyResult::NoTypeSelected;
    db.MarkChanged();
    return outcome;
  }
  const FieldType newType = TypeFromNumber(settings.type);
  const int maxLength = std::clamp(settings.maxCharacters, 0, kMaxLength);

  outcome.change = PendingTypeChange(db, slot, settings.type);
  if (outcome.change == TypeChange::Lose &&
      !session.ui.AskYesNo(type_change_messages::kDataLoss,
                           type_change_messages::kQuestionCaption)) {
    outcome.result = ApplyResult::Declined;
    db.MarkChanged();
    return outcome;
  }
  if (outcome.change != TypeChange::Keep) {
    outcome.conversion = ConvertRecords(db, slot, newType, maxLength, session.ui, session.locale);
    outcome.converted = true;
  }

  FieldDef& f = db.schema().field[slot];
  f.name.set(settings.name);
  f.typeNumber = static_cast<int16_t>(settings.type);
  if (newType == FieldType::Float) {
    f.size = static_cast<int16_t>(settings.places >= 0 && settings.places <= 4 ? settings.places : 4);
  } else {
    f.size = static_cast<int16_t>(maxLength);
  }
  f.width = static_cast<int16_t>(StoredWidthFromPixels(settings.pixelsShown));
  f.visible = settings.visible ? 1 : 0;
  f.exportPrint = settings.exportPrint ? 1 : 0;
  f.popupsAppend = settings.popupsAppend ? 1 : 0;

  switch (newType) {
    case FieldType::PopUp:
      f.param1 = settings.defaultValue >= 0 && settings.defaultValue < PopupCount(db, slot)
                     ? static_cast<uint8_t>(settings.defaultValue)
                     : format::kNoPopupValue;
      break;
    case FieldType::Date:
    case FieldType::Time: f.behavior = static_cast<uint8_t>(settings.behavior); break;
    case FieldType::Link:
    case FieldType::Linked:
    case FieldType::DBPopup: {
      f.text.set(settings.otherDatabase);
      const int other = settings.otherFieldNumber - 1;
      f.otherField = static_cast<uint8_t>(other >= 0 && other < format::kFieldCount ? other : 0);
      if (newType == FieldType::DBPopup) f.param3 = static_cast<uint8_t>(std::max(settings.group, 0));
      if (newType == FieldType::Link) f.param1 = ByteFromFieldEntry(settings.showValueFrom);
      break;
    }
    case FieldType::Calculated:
      f.calcFlags = 0;
      f.param1 = ByteFromFieldEntry(settings.value1);
      if (f.param1 == 255) {
        f.text.clear();
        WriteConstant(f, 0, settings.constant1);
      } else if (settings.prevRecord1) {
        f.calcFlags |= 1;
      }
      f.param2 = ByteFromFieldEntry(settings.value2);
      if (f.param2 == 255) {
        WriteConstant(f, kConstant2At, settings.constant2);
      } else if (settings.prevRecord2) {
        f.calcFlags |= 2;
      }
      f.calcOperation = static_cast<uint8_t>(settings.operation);
      f.setResultFormat(static_cast<uint8_t>(settings.resultFormat));
      break;
    default: break;
  }

  RecalculateAfterDesignChange(session);
  db.MarkChanged();
  return outcome;
}

}  // namespace cx
