#include "cli/typed_value.h"

#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "engine/dates.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

// Float fields and calculated results keep the text that was typed or
// computed, with the decimal separator of the settings in force then.
void NumberFromText(JsonWriter& json, std::string text) {
  for (char& c : text) {
    if (c == ',') c = '.';
  }
  size_t begin = text.find_first_not_of(' ');
  if (begin == std::string::npos) {
    json.Null();
    return;
  }
  size_t end = text.find_last_not_of(' ') + 1;
  const char* first = text.data() + begin;
  if (*first == '+') ++first;
  double value = 0;
  auto [ptr, ec] = std::from_chars(first, text.data() + end, value);
  if (ec == std::errc() && ptr == text.data() + end) {
    json.Double(value);
  } else {
    json.String(Cp1252ToUtf8(text.substr(begin, end - begin)));
  }
}

void TextOrNull(JsonWriter& json, const std::string& text) {
  if (text.empty()) {
    json.Null();
  } else {
    json.String(Cp1252ToUtf8(text));
  }
}

}  // namespace

std::string IsoDateText(uint32_t dayNumber) {
  CalendarDate d = DayNumberToDate(dayNumber);
  char buf[16];
  std::snprintf(buf, sizeof buf, "%04d-%02d-%02d", d.year, d.month, d.day);
  return buf;
}

std::string ClockText(long hours, long minutes, long seconds) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "%02ld:%02ld:%02ld", hours, minutes, seconds);
  return buf;
}

void WriteTypedValue(JsonWriter& json, const Schema& schema, const PopupLists& popups,
                     ByteView record, int slot) {
  const FieldDef& field = schema.field[slot];
  const std::optional<ByteView> value = FieldValue(record, slot);
  if (!value) {
    json.Null();
    return;
  }
  switch (field.type()) {
    case FieldType::NotUsed:
    case FieldType::Image:
    case FieldType::Heading:
      json.Null();
      return;
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
      TextOrNull(json, ValueString(*value));
      return;
    case FieldType::Float:
      NumberFromText(json, ValueString(*value));
      return;
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Linked:
      json.Number(static_cast<int32_t>(ValueNumber(*value)));
      return;
    case FieldType::PopUp: {
      const int item = value->empty() ? format::kNoPopupValue : (*value)[0];
      const auto& items = popups[slot].items;
      if (item == format::kNoPopupValue || static_cast<size_t>(item) >= items.size()) {
        json.Null();
      } else {
        TextOrNull(json, PopupText(popups[slot], item));
      }
      return;
    }
    case FieldType::CheckBox:
      json.Bool(!value->empty() && (*value)[0] != 0);
      return;
    case FieldType::Date: {
      const uint32_t day = ValueNumber(*value);
      if (day == 0) {
        json.Null();
      } else {
        json.String(IsoDateText(day));
      }
      return;
    }
    case FieldType::Time: {
      uint8_t b[4] = {0, 0, 0, 0};
      for (size_t i = 0; i < value->size() && i < 4; ++i) b[i] = (*value)[i];
      if (b[2] == 255) {
        json.Null();
      } else {
        json.String(ClockText(b[2], b[1], b[0]));
      }
      return;
    }
    case FieldType::Calculated: {
      const std::string stored = ValueString(*value);
      switch (field.resultFormat()) {
        case 2: {
          // A duration, which may pass a day or fall below zero.
          long seconds = std::strtol(stored.c_str(), nullptr, 10);
          const bool negative = seconds < 0;
          if (negative) seconds = -seconds;
          json.String((negative ? "-" : "") +
                      ClockText(seconds / 3600, seconds / 60 % 60, seconds % 60));
          return;
        }
        case 3: {
          const long day = std::strtol(stored.c_str(), nullptr, 10);
          if (day <= 0) {
            json.Null();
          } else {
            json.String(IsoDateText(static_cast<uint32_t>(day)));
          }
          return;
        }
        default:
          NumberFromText(json, stored);
          return;
      }
    }
  }
  json.Null();
}

}  // namespace cx::cli
