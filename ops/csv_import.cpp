#include "ops/csv_import.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdint>
#include <optional>

#include "engine/field_types.h"
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

std::string_view Trimmed(std::string_view text) {
  auto blank = [](char c) { return c == ' ' || (c >= '\t' && c <= '\r'); };
  while (!text.empty() && blank(text.front())) text.remove_prefix(1);
  while (!text.empty() && blank(text.back())) text.remove_suffix(1);
  return text;
}

bool EqualsNoCase(std::string_view text, std::string_view lower) {
  return text.size() == lower.size() &&
         std::equal(text.begin(), text.end(), lower.begin(), [](char a, char b) {
           return std::tolower(static_cast<unsigned char>(a)) == b;
         });
}

// Digits with an optional sign that fit the stored 32 bits unchanged.
bool IsWholeNumber(std::string_view text) {
  text = Trimmed(text);
  if (!text.empty() && (text[0] == '+' || text[0] == '-')) text.remove_prefix(1);
  if (text.empty() || text.size() > 10) return false;
  int64_t value = 0;
  for (char c : text) {
    if (c < '0' || c > '9') return false;
    value = value * 10 + (c - '0');
  }
  return value <= int64_t{INT32_MAX};
}

// A decimal number as the list and the calculations read it: sign, digits
// with one point (the locale's or "."), an exponent.
bool IsDecimalNumber(std::string_view text, char point) {
  text = Trimmed(text);
  size_t i = 0;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) ++i;
  size_t digits = 0;
  bool pointSeen = false;
  for (; i < text.size(); ++i) {
    const char c = text[i];
    if (c >= '0' && c <= '9') {
      ++digits;
    } else if ((c == '.' || c == point) && !pointSeen) {
      pointSeen = true;
    } else {
      break;
    }
  }
  if (digits == 0) return false;
  if (i < text.size() && (text[i] == 'e' || text[i] == 'E')) {
    ++i;
    if (i < text.size() && (text[i] == '+' || text[i] == '-')) ++i;
    const size_t start = i;
    while (i < text.size() && text[i] >= '0' && text[i] <= '9') ++i;
    if (i == start) return false;
  }
  return i == text.size();
}

// Finds, line by line, the values the import rules will store other than
// given. Pop-Up texts new to a list are counted as the import will add
// them, so that the one that finds the list full is caught beforehand.
class IssueFinder {
 public:
  IssueFinder(const Database& db, int mode, const LocaleInfo& locale)
      : db_(db), columns_(Columns(db.schema(), mode)), locale_(locale) {
    Bytes editing = NewEditingRecord(db.schema());
    for (int slot = 0; slot < format::kFieldCount; ++slot) {
      const size_t size = EditingSlot(editing, slot).size();
      room_[slot] = size > 0 ? size - 1 : 0;
    }
  }

  void Check(const CsvLine& line, size_t lineNumber, CsvImportIssues& issues) {
    issues_ = &issues;
    line_ = lineNumber;
    counted_ = false;
    const Schema& schema = db_.schema();
    for (int slot = 0; slot < format::kFieldCount; ++slot) {
      const std::string& text = line.Field(static_cast<size_t>(columns_[slot]));
      if (text.empty()) continue;
      switch (schema.field[slot].type()) {
        case FieldType::Text:
        case FieldType::Note:
        case FieldType::DBPopup:
        case FieldType::Calculated:
          CheckLength(slot, text);
          break;
        case FieldType::Float:
          if (!IsDecimalNumber(text, locale_.decimalSeparator)) {
            Add(slot, CsvIssue::kNotConverted, text);
          } else {
            CheckLength(slot, text);
          }
          break;
        case FieldType::Integer:
        case FieldType::Link:
        case FieldType::Linked:
        case FieldType::Unique:
        case FieldType::CheckBox:
          if (!IsWholeNumber(text)) Add(slot, CsvIssue::kNotConverted, text);
          break;
        case FieldType::PopUp:
          CheckPopup(slot, text);
          break;
        case FieldType::Date:
          if (!EqualsNoCase(Trimmed(text), "no date") && DateTextToDayNumber(text, locale_) == 0) {
            Add(slot, CsvIssue::kNotConverted, text);
          }
          break;
        case FieldType::Time:
          if (!EqualsNoCase(Trimmed(text), "no time")) {
            std::optional<ClockTime> t = ParseTimeText(text, locale_);
            if (!t || t->hours < 0 || t->hours > 23 || t->minutes < 0 || t->minutes > 59) {
              Add(slot, CsvIssue::kNotConverted, text);
            }
          }
          break;
        case FieldType::NotUsed:
        case FieldType::Image:
        case FieldType::Heading:
          break;
      }
    }
    if (line.openQuote) Add(-1, CsvIssue::kOpenQuote, line.Field(line.found ? line.found - 1 : 0));
  }

 private:
  void Add(int slot, CsvIssue issue, const std::string& text) {
    if (!counted_) ++issues_->lines;
    counted_ = true;
    if (issues_->lines > CsvImportIssues::kKeptLines) return;
    constexpr size_t kShown = 30;
    std::string shown = text.size() > kShown ? text.substr(0, kShown) + "..." : text;
    for (char& c : shown) {
      if (c == '\r' || c == '\n') c = ' ';
    }
    const size_t room = issue == CsvIssue::kCut ? (slot >= 0 && db_.schema().field[slot].type() == FieldType::PopUp
                                                       ? format::kMaxPopupText
                                                       : room_[slot])
                                                : 0;
    issues_->first.push_back({line_, slot, issue, std::move(shown), room});
  }

  void CheckLength(int slot, const std::string& text) {
    if (text.size() > room_[slot]) Add(slot, CsvIssue::kCut, text);
  }

  void CheckPopup(int slot, const std::string& text) {
    if (ContainsNoValue(text)) return;
    if (text.size() > format::kMaxPopupText) {
      Add(slot, CsvIssue::kCut, text);
    }
    std::string entry = text.substr(0, format::kMaxPopupText);
    const PopupList& list = db_.popups()[slot];
    for (size_t i = 0; i < list.items.size() && i < static_cast<size_t>(format::kMaxPopupItems); ++i) {
      if (PopupText(list, static_cast<int>(i)) == entry) return;
    }
    std::set<std::string>& added = added_[slot];
    if (added.count(entry)) return;
    if (list.items.size() + added.size() >= static_cast<size_t>(format::kMaxPopupItems)) {
      Add(slot, CsvIssue::kNoPopupRoom, text);
      return;
    }
    added.insert(std::move(entry));
  }

  const Database& db_;
  const ColumnMap columns_;
  const LocaleInfo& locale_;
  std::array<size_t, format::kFieldCount> room_{};
  std::array<std::set<std::string>, format::kFieldCount> added_;
  CsvImportIssues* issues_ = nullptr;
  size_t line_ = 0;
  bool counted_ = false;
};

}  // namespace

std::vector<std::string> CsvImportIssues::Describe(const Schema& schema) const {
  std::vector<std::string> out;
  for (const CsvValueIssue& i : first) {
    std::string where = "line " + std::to_string(i.line);
    if (i.slot >= 0 && i.slot < format::kFieldCount) {
      const FieldDef& field = schema.field[i.slot];
      where += ", field \"" + field.name.str() + "\" (" + std::string(FieldTypeLabel(field.type())) + ")";
    }
    const std::string value = "\"" + i.text + "\"";
    switch (i.issue) {
      case CsvIssue::kNotConverted:
        out.push_back(where + ": " + value + " cannot be read");
        break;
      case CsvIssue::kCut:
        out.push_back(where + ": " + value + " was cut to " + std::to_string(i.room) + " characters");
        break;
      case CsvIssue::kNoPopupRoom:
        out.push_back(where + ": " + value + " has no choice: the list already holds " +
                      std::to_string(format::kMaxPopupItems) + " entries");
        break;
      case CsvIssue::kOpenQuote:
        out.push_back(where + ": a quote is never closed, so the rest of the file became one value");
        break;
    }
  }
  return out;
}

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

namespace {

// Both passes read the header line, if any, and pass it by.
CsvImportResult ImportCsvStream(Database& db, CsvStream& in, const std::string& path, int mode,
                                const CsvSettings& settings, const LocaleInfo& locale, bool strict,
                                bool skipHeader) {
  CsvImportResult result;
  const Schema& schema = db.schema();
  const ColumnMap columns = Columns(schema, mode);
  CsvLine line;
  uint32_t largest = 0;
  IssueFinder finder(db, mode, locale);
  size_t fileLine = 1;
  if (skipHeader && ReadCsvLine(in, line, settings.separator)) fileLine += 1 + line.innerLineEnds;
  const uint64_t firstRecord = in.Tell();
  while (ReadCsvLine(in, line, settings.separator)) {
    ++result.lines;
    finder.Check(line, fileLine, result.issues);
    fileLine += 1 + line.innerLineEnds;
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
  if (strict && !result.issues.empty()) {
    result.status = Status::Error(std::to_string(result.issues.lines) +
                                  (result.issues.lines == 1 ? " line holds" : " lines hold") +
                                  " values that cannot be imported as they are; nothing was imported.");
    return result;
  }
  if (largest != 0 && largest != UINT32_MAX && largest >= db.NextUniqueNumber()) {
    db.SetNextUniqueNumber(largest + 1);
  }
  in.Seek(firstRecord);
  Bytes editing;
  while (ReadCsvLine(in, line, settings.separator)) {
    if (!ImportCsvRecord(db, line, mode, locale, &editing)) break;
    ++result.imported;
  }
  if (in.failed()) result.status = Status::Error("Cannot read " + path);
  return result;
}

}  // namespace

CsvImportResult ImportCsvFile(Database& db, const std::string& path, int mode,
                              const CsvSettings& settings, const LocaleInfo& locale, bool strict,
                              bool skipHeader) {
  CsvStream in;
  if (Status s = in.Open(path); !s) {
    CsvImportResult result;
    result.status = s;
    return result;
  }
  return ImportCsvStream(db, in, path, mode, settings, locale, strict, skipHeader);
}

CsvImportResult ImportCsvText(Database& db, std::string text, const std::string& name, int mode,
                              const CsvSettings& settings, const LocaleInfo& locale, bool strict,
                              bool skipHeader) {
  CsvStream in(std::move(text));
  return ImportCsvStream(db, in, name, mode, settings, locale, strict, skipHeader);
}

}  // namespace cx
