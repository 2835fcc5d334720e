#include "design/type_change.h"

#include <algorithm>

#include "engine/value_text.h"
#include "ops/field_values.h"
#include "ops/value_parse.h"

namespace cx {
namespace {

using T = FieldType;

bool IsTextLike(T t) {
  return t == T::Text || t == T::Float || t == T::Note || t == T::DBPopup || t == T::Calculated;
}
// The text types whose conversions read the text (Note is not among them:
// its values are always reset).
bool ReadsText(T t) { return t == T::Text || t == T::Float || t == T::DBPopup || t == T::Calculated; }
bool IsChoice(T t) { return t == T::PopUp || t == T::CheckBox || t == T::Date || t == T::Time; }
bool IsNumbered(T t) { return t == T::Unique || t == T::Link || t == T::Linked; }

// Float and Calculated slots hold at most 14 characters (their 15-byte
// editing slot ends in a forced NUL); Note 1999.
constexpr int kFloatChars = 14;

Bytes Number(uint32_t n) {
  return {uint8_t(n), uint8_t(n >> 8), uint8_t(n >> 16), uint8_t(n >> 24)};
}

Bytes Text(const std::string& text, int maxChars) {
  const size_t n = std::min(text.size(), static_cast<size_t>(std::max(maxChars, 0)));
  Bytes out(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(n));
  out.push_back(0);
  return out;
}

Bytes LinkedNumber(uint32_t n) {
  Bytes out(24 + 1, 0);
  for (int i = 0; i < 4; ++i) out[i] = uint8_t(n >> (8 * i));
  return out;
}

Bytes Time(int hours, int minutes, int seconds) {
  return {uint8_t(seconds), uint8_t(minutes), uint8_t(hours), 0};
}

int TextLimit(T type, int maxLength) {
  switch (type) {
    case T::Float:
    case T::Calculated: return kFloatChars;
    case T::Note: return 1999;
    default: return std::clamp(maxLength, 0, 254);
  }
}

// The old value as text, the way the conversions read it: the display
// text, with a missing slot and a type's "no value" form read as empty.
std::string OldText(const ValueContext& ctx, ByteView record, int slot) {
  auto value = FieldValue(record, slot);
  if (!value || value->empty()) return {};
  switch (ctx.schema.field[slot].type()) {
    case T::PopUp:
      if ((*value)[0] == format::kNoPopupValue) return {};
      break;
    case T::Date:
      if (ValueNumber(*value) == 0) return {};
      break;
    case T::Time:
      if (value->size() < 3 || (*value)[2] == format::kNoTimeHours) return {};
      break;
    default: break;
  }
  return ValueText(ctx, record, slot);
}

int32_t OldInteger(ByteView record, int slot) {
  auto value = FieldValue(record, slot);
  return value ? static_cast<int32_t>(ValueNumber(*value)) : 0;
}

}  // namespace

TypeChange ClassifyTypeChange(FieldType from, FieldType to) {
  if (to == from || to == T::NotUsed) return TypeChange::Keep;
  if (from == T::NotUsed) return TypeChange::Convert;
  if (IsTextLike(from)) {
    if (IsTextLike(to)) return TypeChange::Keep;
    if (to == T::PopUp || to == T::Image || to == T::Heading) return TypeChange::Lose;
    return TypeChange::Convert;
  }
  if (from == T::Integer) {
    if (to == T::Unique) return TypeChange::Keep;
    if (to == T::Text || to == T::Float) return TypeChange::Convert;
    return TypeChange::Lose;
  }
  if (IsChoice(from)) return to == T::Text ? TypeChange::Convert : TypeChange::Lose;
  if (IsNumbered(from)) {
    if (to == T::Integer || to == T::Unique || to == T::Link) return TypeChange::Keep;
    if (to == T::Text || to == T::Float) return TypeChange::Convert;
    return TypeChange::Lose;
  }
  return TypeChange::Lose;  // Image, Heading
}

ConversionRule ConversionRuleFor(FieldType from, FieldType to) {
  using R = ConversionRule;
  if (ReadsText(from)) {
    switch (to) {
      case T::CheckBox: return R::TextToCheckBox;
      case T::Integer: return R::TextToInteger;
      case T::Unique: return R::AskUnique;
      case T::Link: return R::AskLink;
      case T::Linked: return R::AskLinked;
      case T::Date: return R::ParseDate;
      case T::Time: return R::ParseTime;
      default: return R::Reset;
    }
  }
  if (from == T::Integer) {
    if (to == T::Text) return R::IntegerToText;
    if (to == T::Float) return R::IntegerToFloat;
    return R::Reset;
  }
  if (IsChoice(from)) return to == T::Text ? R::ToText : R::Reset;
  if (IsNumbered(from)) {
    if (to == T::Text) return R::NumberToText;
    if (to == T::Float) return R::NumberToFloat;
    return R::Reset;
  }
  return R::Reset;  // Note, Not-Used, Image, Heading
}

std::string ConversionQuestion(ConversionRule rule) {
  constexpr const char* kUniqueNote =
      " (Note: The values must be unique numbers for this to convert properly.)";
  switch (rule) {
    case ConversionRule::AskUnique:
      return std::string("Use the existing data in this field for the unique values?") +
             kUniqueNote + " ";
    case ConversionRule::AskLink:
      return std::string("Use the existing data in this field for the link values?") +
             kUniqueNote + " ";
    case ConversionRule::AskLinked:
      return "Use the existing data in this field for the linked values? (Note: The values must "
             "be numbers that relate to the link field for this to convert properly.) ";
    default: return {};
  }
}

Bytes EmptyStoredValue(FieldType type) {
  switch (type) {
    case T::NotUsed:
    case T::Heading: return {};
    case T::Integer:
    case T::Unique:
    case T::Link:
    case T::Date: return Number(0);
    case T::Time: return Time(format::kNoTimeHours, 0, 0);
    case T::PopUp: return {format::kNoPopupValue};
    case T::CheckBox:
    case T::Image: return {0};
    case T::Linked: return LinkedNumber(0);
    default: return {0};  // the texts
  }
}

Bytes WithSlotValue(ByteView stored, int slot, ByteView value, const Schema& schema) {
  Bytes out;
  size_t start = 1;
  if (stored.empty()) {
    out.push_back(schema.recordExtension ? 1 : 0);
    if (schema.recordExtension) out.insert(out.end(), format::kExtensionSize, 0);
  } else {
    start = std::min(DataStart(stored), stored.size());
    out.assign(stored.begin(), stored.begin() + static_cast<std::ptrdiff_t>(start));
    if (out.size() < start) out.resize(start, 0);
  }

  // The slots the record holds, as [begin, end) of their length and bytes.
  struct Span {
    size_t begin, end;
    bool cut;  // its length runs past the end of the record
  };
  std::vector<Span> present;
  size_t pos = start;
  while (present.size() < format::kFieldCount && pos + 2 <= stored.size()) {
    const size_t length = stored[pos] | (size_t(stored[pos + 1]) << 8);
    if (length == format::kEndMark) break;
    const size_t end = pos + 2 + length;
    present.push_back({pos, std::min(end, stored.size()), end > stored.size()});
    pos = std::min(end, stored.size());
  }

  const int last = std::max(static_cast<int>(present.size()) - 1, slot);
  auto putLength = [&out](size_t n) {
    out.push_back(uint8_t(n));
    out.push_back(uint8_t(n >> 8));
  };
  for (int s = 0; s <= last; ++s) {
    if (s == slot) {
      putLength(value.size());
      out.insert(out.end(), value.begin(), value.end());
    } else if (s < static_cast<int>(present.size())) {
      const Span& p = present[s];
      if (p.cut && s < last) {
        // Slots follow now, so the length must say what is really there.
        putLength(p.end - p.begin - 2);
        out.insert(out.end(), stored.begin() + p.begin + 2, stored.begin() + p.end);
      } else {
        out.insert(out.end(), stored.begin() + p.begin, stored.begin() + p.end);
      }
    } else {
      putLength(0);
    }
  }
  if (last < format::kFieldCount - 1) putLength(format::kEndMark);
  return out;
}

ConversionOutcome ConvertRecords(Database& db, int slot, FieldType newType, int newMaxLength,
                                 UiPort& ui, const LocaleInfo& locale) {
  using R = ConversionRule;
  ConversionOutcome outcome;
  const T oldType = db.schema().field[slot].type();
  outcome.rule = ConversionRuleFor(oldType, newType);

  bool useExisting = false;
  const std::string question = ConversionQuestion(outcome.rule);
  if (!question.empty()) {
    outcome.asked = true;
    useExisting = ui.AskYesNo(question, type_change_messages::kQuestionCaption);
    outcome.usedExisting = useExisting;
  }

  ui.SetBusy(true);
  const ValueContext ctx{db.schema(), db.popups(), locale};
  const int limit = TextLimit(newType, newMaxLength);
  const bool numbers = newType == T::Unique || newType == T::Link;
  int64_t largest = 0;

  for (size_t i = 0; i < db.recordCount(); ++i) {
    ByteView record = db.record(i);
    Bytes value;
    switch (outcome.rule) {
      case R::TextToCheckBox:
        value = {uint8_t(ParseDouble(OldText(ctx, record, slot)) != 0.0 ? 1 : 0)};
        break;
      case R::TextToInteger:
        value = Number(static_cast<uint32_t>(ParseLong(OldText(ctx, record, slot))));
        break;
      case R::ParseDate:
        value = Number(DateTextToDayNumber(OldText(ctx, record, slot), locale));
        break;
      case R::ParseTime: {
        auto t = ParseTimeText(OldText(ctx, record, slot), locale);
        if (t && t->hours >= 0 && t->hours < 24 && t->minutes >= 0 && t->minutes < 60 &&
            t->seconds >= 0 && t->seconds < 60) {
          value = Time(t->hours, t->minutes, t->seconds);
        } else {
          value = Time(format::kNoTimeHours, 0, 0);
        }
        break;
      }
      case R::IntegerToText:
      case R::NumberToText:
        value = Text(std::to_string(OldInteger(record, slot)), limit);
        break;
      case R::IntegerToFloat:
      case R::NumberToFloat:
        value = Text(std::to_string(OldInteger(record, slot)), kFloatChars);
        break;
      case R::ToText:
        value = Text(OldText(ctx, record, slot), limit);
        break;
      case R::AskUnique:
      case R::AskLink:
      case R::AskLinked:
        if (useExisting) {
          const int32_t n = ParseLong(OldText(ctx, record, slot));
          largest = std::max<int64_t>(largest, n);
          value = newType == T::Linked ? LinkedNumber(static_cast<uint32_t>(n))
                                       : Number(static_cast<uint32_t>(n));
          break;
        }
        [[fallthrough]];
      case R::Reset:
        value = numbers ? Number(db.TakeUniqueNumber()) : EmptyStoredValue(newType);
        break;
    }
    db.ReplaceRecord(i, WithSlotValue(record, slot, value, db.schema()));
    ++outcome.recordsRewritten;
  }
  if (useExisting && numbers) db.SetNextUniqueNumber(static_cast<uint32_t>(largest + 1));
  ui.SetBusy(false);
  return outcome;
}

}  // namespace cx
