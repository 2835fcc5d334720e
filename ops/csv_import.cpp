#include "ops/csv_import.h"

#include <algorithm>
#include <array>
#include <cctype>

#include "engine/popups.h"
#include "ops/value_parse.h"

namespace cx {
namespace {

using ColumnMap = std::array<int, format::kFieldCount>;

bool IsUsed(const FieldDef& field) { return field.type() != FieldType::NotUsed; }

// The column each field slot reads.
ColumnMap Columns(const Schema& schema, int mode) {
  ColumnMap columns{};
  if (mode == kCsvColumnsBySlot) {
    for (int slot = 0; slot < format::kFieldCount; ++slot) columns[slot] = slot;
    return columns;
  }
  int used = 0;
  for (int pos = 0; pos < format::kFieldCount; ++pos) {
    int slot = schema.fieldOrder[pos];
    if (slot >= format::kFieldCount) continue;
    columns[slot] = used;
    if (IsUsed(schema.field[slot])) ++used;
  }
  return columns;
}

bool HasDigit(const std::string& text) {
  return std::any_of(text.begin(), text.end(),
                     [](char c) { return std::isdigit(static_cast<unsigned char>(c)) != 0; });
}

bool ContainsNoValue(const std::string& text) {
  static constexpr std::string_view kNoValue = "no value";
  auto it = std::search(text.begin(), text.end(), kNoValue.begin(), kNoValue.end(),
                        [](char a, char b) {
                          return std::tolower(static_cast<unsigned char>(a)) == b;
                        });
  return it != text.end();
}

// The entry index for a Pop-Up text, appending it when it is new and the
// list has room; 255 for no choice.
uint8_t PopupChoice(Database& db, int slot, const std::string& text) {
  if (text.empty() || ContainsNoValue(text)) return format::kNoPopupValue;
  std::string entry = text.substr(0, format::kMaxPopupText);
  PopupList& list = db.popups()[slot];
  for (size_t i = 0; i < list.items.size() && i < static_cast<size_t>(format::kMaxPopupItems); ++i) {
    if (PopupText(list, static_cast<int>(i)) == entry) return static_cast<uint8_t>(i);
  }
  if (list.items.size() >= static_cast<size_t>(format::kMaxPopupItems)) return format::kNoPopupValue;
  list.items.push_back(std::move(entry));
  db.MarkChanged();
  return static_cast<uint8_t>(list.items.size() - 1);
}

void PutTime(Bytes& editing, int slot, const std::string& text, const LocaleInfo& locale) {
  std::span<uint8_t> value = EditingSlot(editing, slot);
  if (value.size() < 4) return;
  // Seconds are not carried over: the value keeps hours and minutes.
  std::optional<ClockTime> t = ParseTimeText(text, locale);
  if (t && t->hours >= 0 && t->hours <= 23 && t->minutes >= 0 && t->minutes <= 59) {
    value[0] = 0;
    value[1] = static_cast<uint8_t>(t->minutes);
    value[2] = static_cast<uint8_t>(t->hours);
  } else {
    value[0] = 0;
    value[1] = 0;
    value[2] = format::kNoTimeHours;
  }
  value[3] = 0;
}

// A number given is kept (the database then keeps its next unique number
// above it); a column without one gets the next number.
void PutUnique(Database& db, Bytes& editing, int slot, const std::string& text) {
  uint32_t number = HasDigit(text) ? static_cast<uint32_t>(ParseLong(text)) : db.TakeUniqueNumber();
  SetEditingNumber(editing, slot, number, db.schema());
}

}  // namespace

bool ImportCsvRecord(Database& db, const CsvLine& line, int mode, const LocaleInfo& locale,
                     Bytes* scratch) {
  if (!db.CanAddRecord()) return false;
  const Schema& schema = db.schema();
  const ColumnMap columns = Columns(schema, mode);
  // Every record writes the same bytes of the editing form (whole text
  // slots, whole numbers), so one form can serve a whole import without
  // being cleared: what one line leaves there the next overwrites.
  Bytes local;
  Bytes& editing = scratch ? *scratch : local;
  if (editing.size() != EditingSize(schema)) editing = NewEditingRecord(schema);
  for (int slot = 0; slot < format::kFieldCount; ++slot) {
    const std::string& text = line.Field(static_cast<size_t>(columns[slot]));
    switch (schema.field[slot].type()) {
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
      case FieldType::Float:
      case FieldType::Calculated:
        SetEditingText(editing, slot, text, schema);
        break;
      case FieldType::Integer:
      case FieldType::Link:
      case FieldType::Linked:
        SetEditingNumber(editing, slot, static_cast<uint32_t>(ParseLong(text)), schema);
        break;
      case FieldType::Unique:
        PutUnique(db, editing, slot, text);
        break;
      case FieldType::CheckBox:
        SetEditingByte(editing, slot, ParseLong(text) != 0 ? 1 : 0, schema);
        break;
      case FieldType::PopUp:
        SetEditingByte(editing, slot, PopupChoice(db, slot, text), schema);
        break;
      case FieldType::Date:
        SetEditingNumber(editing, slot, DateTextToDayNumber(text, locale), schema);
        break;
      case FieldType::Time:
        PutTime(editing, slot, text, locale);
        break;
      case FieldType::NotUsed:
      case FieldType::Image:
      case FieldType::Heading:
        break;
    }
  }
  return db.AppendRecord(Compact(editing, schema));
}

CsvImportResult ImportCsvFile(Database& db, const std::string& path, int mode,
                              const CsvSettings& settings, const LocaleInfo& locale) {
  CsvImportResult result;
  CsvStream in;
  if (Status s = in.Open(path); !s) {
    result.status = s;
    return result;
  }
  const Schema& schema = db.schema();
  const ColumnMap columns = Columns(schema, mode);
  CsvLine line;
  uint32_t largest = 0;
  while (ReadCsvLine(in, line, settings.separator)) {
    ++result.lines;
    for (int slot = 0; slot < format::kFieldCount; ++slot) {
      FieldType type = schema.field[slot].type();
      if (type != FieldType::Unique && type != FieldType::Link) continue;
      const std::string& text = line.Field(static_cast<size_t>(columns[slot]));
      // Compared as the stored 32-bit number, as the database compares them.
      if (HasDigit(text)) largest = std::max(largest, static_cast<uint32_t>(ParseLong(text)));
    }
  }
  if (in.failed()) {
    result.status = Status::Error("Cannot read " + path);
    return result;
  }
  const size_t room = static_cast<size_t>(format::kMaxDataRecords) - db.recordCount();
  if (result.lines > room) {
    result.status = Status::Error("The file holds " + std::to_string(result.lines) +
                                  " records; the database has room for " + std::to_string(room) +
                                  " more.");
    return result;
  }
  if (largest != 0 && largest != UINT32_MAX && largest >= db.NextUniqueNumber()) {
    db.SetNextUniqueNumber(largest + 1);
  }
  in.Seek(0);
  Bytes editing;
  while (ReadCsvLine(in, line, settings.separator)) {
    if (!ImportCsvRecord(db, line, mode, locale, &editing)) break;
    ++result.imported;
  }
  if (in.failed()) result.status = Status::Error("Cannot read " + path);
  return result;
}

}  // namespace cx
