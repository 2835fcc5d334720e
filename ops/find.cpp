#include "ops/find.h"

#include <algorithm>
#include <cstdlib>

#include "engine/value_text.h"
#include "ops/field_values.h"
#include "ops/sort.h"

namespace cx {
namespace {

constexpr const char* kNotFound = "Not Found in Database!";

bool AllDigits(const std::string& s) {
  return !s.empty() && std::all_of(s.begin(), s.end(), [](char c) { return c >= '0' && c <= '9'; });
}

// The field test on a value already looked up.
int ValueMatches(const Database& db, std::optional<ByteView> value, int field, const std::string& needle,
                 bool caseSensitive, bool beginsWith, const LocaleInfo& locale) {
  if (!value) return 0;
  const FieldDef& def = db.schema().field[field];
  auto match = [&](std::string_view text) { return ContainsText(text, needle, beginsWith) ? 1 : 0; };
  auto matchFolded = [&](std::string_view text) {
    return ContainsText(text, needle, beginsWith, !caseSensitive) ? 1 : 0;
  };

  switch (def.type()) {
    case FieldType::NotUsed:
    case FieldType::Image:
    case FieldType::Link:
    case FieldType::Heading:
      return 0;
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup: {
      std::string_view text = ValueView(*value);
      return text.empty() ? 0 : matchFolded(text);
    }
    case FieldType::Float: {
      std::string_view text = ValueView(*value);
      return text.empty() ? 0 : match(text);
    }
    case FieldType::Integer:
    case FieldType::Unique:
      if (!AllDigits(needle)) return 0;
      return match(std::to_string(static_cast<int32_t>(ValueNumber(*value))));
    case FieldType::PopUp:
      return matchFolded(PopupText(db.popups()[field], value->empty() ? 0 : (*value)[0]));
    case FieldType::CheckBox: {
      const bool checked = !value->empty() && (*value)[0] != 0;
      return (needle == "1" && checked) || (needle == "0" && !checked) ? 1 : 0;
    }
    case FieldType::Date: {
      const uint32_t day = ValueNumber(*value);
      return match(day == 0 ? std::string("No Date") : DateText(day, locale));
    }
    case FieldType::Time: {
      const uint32_t t = Time24(*value);
      const uint8_t hours = static_cast<uint8_t>(t >> 16);
      if (hours == format::kNoTimeHours) return match("No Time");
      return match(TimeText(static_cast<uint8_t>(t), static_cast<uint8_t>(t >> 8), hours, locale));
    }
    case FieldType::Linked: {
      std::optional<std::string_view> text = LinkedText(*value);
      return text ? matchFolded(*text) : 0;
    }
    case FieldType::Calculated: {
      std::string_view text = ValueView(*value);
      if (text.empty()) return 0;
      const long number = ParseLong(text);
      switch (CalcKindOf(def)) {
        case CalcKind::Time: return match(SecondsText(number));
        case CalcKind::Date: return match(DateText(static_cast<uint32_t>(number), locale));
        case CalcKind::Whole:
        case CalcKind::Decimal: return match(text);
        case CalcKind::Unknown: return 0;
      }
      return 0;
    }
  }
  return 0;
}

}  // namespace

int FieldMatches(const Database& db, ByteView record, int field, const std::string& needle,
                 bool caseSensitive, bool beginsWith, const LocaleInfo& locale) {
  return ValueMatches(db, FieldValue(record, field), field, needle, caseSensitive, beginsWith, locale);
}

int ListColumnOfField(const Schema& schema, int field) {
  int column = 0;
  for (uint8_t f : schema.fieldOrder) {
    if (f >= format::kFieldCount || schema.field[f].width == 0) continue;
    if (f == field) return column;
    ++column;
  }
  return -1;
}

int FindRecord(const Database& db, const SearchSettings& search, int startIndex, int startField,
               FindHit* hit, const LinkRestriction* link, UiPort* report, const LocaleInfo& locale) {
  const std::string needle = search.caseSensitive ? search.text : LowerAscii(search.text);
  const long count = static_cast<long>(db.recordCount());
  long start = std::max(startIndex, 0);
  auto notFound = [&] {
    // The last hit stays remembered, so repeating the search still starts
    // after it and never wraps around.
    if (report) ShowErrorBox(*report, kNotFound);
    return -1;
  };
  // A start at the last record counts as past the end: the search starts
  // only from a record that has another one after it.
  if (start >= count - 1) return notFound();

  ViewTester tester(db, link);
  for (long i = start; i < count; ++i) {
    if (!tester.InView(static_cast<size_t>(i))) continue;
    ByteView record = db.record(static_cast<size_t>(i));
    int matched = -1;
    if (search.field != -1) {
      if (FieldMatches(db, record, search.field, needle, search.caseSensitive, search.beginsWith, locale)) {
        matched = search.field;
      }
    } else {
      const int first = i == start ? std::clamp(startField, 0, format::kFieldCount) : 0;
      const SlotValues values = AllSlotValues(record);
      for (int f = first; f < format::kFieldCount && matched < 0; ++f) {
        if (ValueMatches(db, values[f], f, needle, search.caseSensitive, search.beginsWith, locale)) {
          matched = f;
        }
      }
    }
    if (matched >= 0) {
      if (hit) *hit = FindHit{static_cast<int>(i), matched, ListColumnOfField(db.schema(), matched)};
      return static_cast<int>(i);
    }
  }
  return notFound();
}

int SearchDatabase(DataSession& session, const SearchSettings& search) {
  StoreSearchSettings(search, session.db.schema());
  session.db.MarkChanged();
  return FindRecord(session.db, search, 0, 0, &session.found, session.Link(), &session.ui,
                    session.locale);
}

int RepeatFind(DataSession& session) {
  const SearchSettings search = LoadSearchSettings(session.db.schema());
  if (search.text.empty()) return -1;
  const int from = session.found.index < 0 ? 0 : session.found.index + 1;
  return FindRecord(session.db, search, from, 0, &session.found, session.Link(), &session.ui,
                    session.locale);
}

}  // namespace cx
