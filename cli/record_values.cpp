#include "cli/record_values.h"

#include <set>

#include "app/pickers.h"
#include "cli/argument_text.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "engine/dates.h"
#include "ops/field_values.h"
#include "ops/value_parse.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

// The number boxes take at most this many characters.
constexpr size_t kNumberBoxMax = 14;

bool AllDigits(std::string_view s) {
  if (s.empty()) return false;
  for (char c : s) {
    if (c < '0' || c > '9') return false;
  }
  return true;
}

// Integer: an optional sign and digits that fit the stored 32 bits.
bool ReadInteger(const std::string& text, std::string& out) {
  std::string_view digits = text;
  if (!digits.empty() && (digits[0] == '+' || digits[0] == '-')) digits.remove_prefix(1);
  if (!AllDigits(digits) || text.size() > kNumberBoxMax) return false;
  auto n = ParseNumber(text);
  if (!n || *n < INT32_MIN || *n > INT32_MAX) return false;
  out = text[0] == '+' ? text.substr(1) : text;
  return true;
}

// Float: sign, digits, the decimal separator in force (or "."), digits.
// Stored with "." so that every reader of the value agrees on it.
bool ReadFloat(const std::string& text, char decimal, std::string& out) {
  std::string s = text;
  for (char& c : s) {
    if (c == decimal) c = '.';
  }
  std::string_view body = s;
  if (!body.empty() && (body[0] == '+' || body[0] == '-')) body.remove_prefix(1);
  const size_t point = body.find('.');
  const std::string_view whole = body.substr(0, point);
  const std::string_view fraction = point == std::string_view::npos ? "" : body.substr(point + 1);
  if (fraction.find('.') != std::string_view::npos) return false;
  if (!(AllDigits(whole) || (whole.empty() && AllDigits(fraction)))) return false;
  if (!fraction.empty() && !AllDigits(fraction)) return false;
  if (s.size() > kNumberBoxMax) return false;
  out = s;
  return true;
}

// A date or time the save fills in itself would overwrite what was typed
// without a word; that is refused instead.
bool FilledOnSave(const RecordForm& form, const FieldDef& def, std::string& error) {
  const bool date = def.type() == FieldType::Date;
  const int added = date ? static_cast<int>(DateBehavior::Added) : static_cast<int>(TimeBehavior::Added);
  const int modified = date ? static_cast<int>(DateBehavior::Modified) : static_cast<int>(TimeBehavior::Modified);
  const bool filled = def.behavior == modified || (form.isNew() && def.behavior == added);
  if (!filled) return false;
  error = Cp1252ToUtf8(def.name.str()) + " is filled in when a record is " +
          (def.behavior == modified ? "modified" : "added") +
          " and takes no typed value (set-field --behavior 0 lets it be typed)";
  return true;
}

bool NoValueText(const std::string& text, std::string_view word) {
  return text.empty() || LowerAscii(text) == LowerAscii(word);
}

}  // namespace

bool ReadAssignments(const Database& db, const std::vector<std::string>& texts,
                     std::vector<FieldAssignment>& out, std::string& error) {
  std::set<int> seen;
  for (const std::string& text : texts) {
    int field = -1;
    size_t eq = text.find('=');
    for (; eq != std::string::npos; eq = text.find('=', eq + 1)) {
      field = ResolveField(db, text.substr(0, eq));
      if (field >= 0) break;
    }
    if (field < 0) {
      error = text.find('=') == std::string::npos
                  ? "\"" + text + "\" is not FIELD=VALUE"
                  : "no field " + text.substr(0, text.find('='));
      return false;
    }
    if (!seen.insert(field).second) {
      error = "field " + text.substr(0, eq) + " is given twice";
      return false;
    }
    out.push_back({field, text.substr(eq + 1)});
  }
  return true;
}

bool TypeValue(RecordForm& form, const LocaleInfo& locale, int field, const std::string& value,
               std::string& error) {
  const Database& db = form.session().db;
  const FieldDef& def = db.schema().field[field];
  const std::string name = Cp1252ToUtf8(def.name.str());
  const std::string what = "the value of " + name;
  std::string stored;
  auto text = [&](bool multiLine) {
    std::string typed = value;
    if (multiLine) {
      // The file's line breaks are CR LF, as the editor's note box writes them.
      std::string crlf;
      for (size_t i = 0; i < typed.size(); ++i) {
        if (typed[i] == '\n' && (i == 0 || typed[i - 1] != '\r')) crlf.push_back('\r');
        crlf.push_back(typed[i]);
      }
      typed = std::move(crlf);
    } else {
      for (char& c : typed) {
        if (c == '\n' || c == '\r') c = ' ';
      }
    }
    if (!ToStoredText(typed, what, stored, error)) return false;
    const int room = form.TextRoom(field);
    if (static_cast<int>(stored.size()) > room) {
      error = what + " has " + std::to_string(stored.size()) + " characters; " + name + " holds at most " +
              std::to_string(room);
      return false;
    }
    form.SetText(field, stored);
    return true;
  };

  switch (def.type()) {
    case FieldType::Text:
    case FieldType::DBPopup:
      return text(false);
    case FieldType::Note:
      return text(true);
    case FieldType::Integer:
      if (!ReadInteger(value, stored)) {
        error = what + " is not a whole number: \"" + value + "\"";
        return false;
      }
      form.SetText(field, stored);
      return true;
    case FieldType::Float:
      if (!ReadFloat(value, locale.decimalSeparator, stored)) {
        error = what + " is not a number: \"" + value + "\"";
        return false;
      }
      form.SetText(field, stored);
      return true;
    case FieldType::CheckBox: {
      const std::optional<bool> on = ParseSwitch(LowerAscii(value));
      if (!on) {
        error = what + " is not 1 or 0 (yes or no): \"" + value + "\"";
        return false;
      }
      form.SetByte(field, *on ? 1 : 0);
      return true;
    }
    case FieldType::PopUp: {
      const auto entries = PopupMenuEntries(db, field, true, false);
      std::optional<std::string> wanted = StoredTextOrNothing(value);
      for (const PopupMenuEntry& e : entries) {
        if (!wanted || LowerAscii(e.text) != LowerAscii(*wanted)) continue;
        const int index = PopupResultForEntry(db, field, {e}, e.id);
        // The editor's list writes "No Value" as 255, as a new record holds it.
        form.SetByte(field, static_cast<uint8_t>(index == kPopupNoValue ? 255 : index));
        return true;
      }
      error = what + " is not an entry of its list: \"" + value + "\"";
      return false;
    }
    case FieldType::Date: {
      if (FilledOnSave(form, def, error)) return false;
      if (NoValueText(value, "NO DATE")) {
        form.SetNumber(field, 0);
        return true;
      }
      std::string typed;
      if (!ToStoredText(value, what, typed, error)) return false;
      const std::optional<CalendarDate> date = ParseDateText(typed, locale);
      const uint32_t day = date ? DateToDayNumber(*date) : 0;
      if (day == 0) {
        error = what + " is not a date from 2 January 1904 on in the format " +
                Cp1252ToUtf8(locale.shortDate) + " (or YYYY-MM-DD): \"" + value + "\"";
        return false;
      }
      form.SetNumber(field, day);
      return true;
    }
    case FieldType::Time: {
      if (FilledOnSave(form, def, error)) return false;
      if (NoValueText(value, "No Time")) {
        form.SetTime(field, TimeBytes{});
        return true;
      }
      std::string typed;
      if (!ToStoredText(value, what, typed, error)) return false;
      const std::optional<ClockTime> t = ParseTimeText(typed, locale);
      if (!t || t->hours < 0 || t->hours > 23 || t->minutes < 0 || t->minutes > 59 || t->seconds < 0 ||
          t->seconds > 59) {
        error = what + " is not a time of day in the format " + Cp1252ToUtf8(locale.timeFormat) + ": \"" +
                value + "\"";
        return false;
      }
      form.SetTime(field, TimeBytes{static_cast<uint8_t>(t->seconds), static_cast<uint8_t>(t->minutes),
                                    static_cast<uint8_t>(t->hours), 0});
      return true;
    }
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Linked:
    case FieldType::Calculated:
      error = name + " is filled in by the program and takes no typed value";
      return false;
    case FieldType::Image:
      error = name + " is an Image field; images cannot be typed";
      return false;
    case FieldType::Heading:
    case FieldType::NotUsed:
      error = name + " holds no value";
      return false;
  }
  return false;
}

}  // namespace cx::cli
