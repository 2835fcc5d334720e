// Changing the type of a field that already holds data: whether the stored
// values are kept as they lie, converted, or lost, which conversion applies,
// and the rewriting of every record so that its value fits the new type.
#pragma once

#include <string>

#include "engine/field_types.h"
#include "engine/record_store.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx {

enum class TypeChange { Keep, Convert, Lose };

// The class of a change from `from` to `to` for a field that holds data.
// Changing to Not-Used, or to the same type, keeps.
TypeChange ClassifyTypeChange(FieldType from, FieldType to);

enum class ConversionRule {
  Reset,           // every record gets the new type's empty value
  TextToCheckBox,  // checked when the text reads as a nonzero number
  TextToInteger,   // the text read as a whole number
  AskUnique,       // question; Yes: use the existing data, No: renumber
  AskLink,         // question; Yes: use the existing data, No: renumber
  AskLinked,       // question; Yes: use the existing data, No: reset
  ParseDate,       // the text read as a date (empty: no date)
  ParseTime,       // the text read as a time (empty: no time)
  IntegerToText,   // decimal text, cut to the new max length
  IntegerToFloat,  // decimal text
  ToText,          // the value's display text, cut to the new max length
  NumberToText,    // the 32-bit number read as an Integer, then as IntegerToText
  NumberToFloat,   // the same, then as IntegerToFloat
};

// The rule the record conversion applies for a change it is run for.
ConversionRule ConversionRuleFor(FieldType from, FieldType to);

// The question a rule asks ("" when it asks none): its prompt, its note and
// one more blank.
std::string ConversionQuestion(ConversionRule rule);

namespace type_change_messages {
inline constexpr const char* kDataLoss =
    "Can't Switch these Field Types without data loss.  Continue?";
inline constexpr const char* kQuestionCaption = "QUESTION";
}  // namespace type_change_messages

struct ConversionOutcome {
  ConversionRule rule = ConversionRule::Reset;
  bool asked = false;        // a conversion question was put
  bool usedExisting = false; // ...and answered Yes
  size_t recordsRewritten = 0;
};

// Rewrites slot `slot` of every record of `db` from the slot's current type
// to `newType` (all other slots copied byte for byte), asking the rule's
// question through `ui` where there is one. `newMaxLength` limits texts
// (already capped at 254). The schema itself is not changed here.
ConversionOutcome ConvertRecords(Database& db, int slot, FieldType newType, int newMaxLength,
                                 UiPort& ui, const LocaleInfo& locale);

// The stored record `stored` with slot `slot` holding `value` and every
// other slot's bytes as they were; absent slots before it are written
// empty, and the end mark follows unless slot 29 is the last one written.
Bytes WithSlotValue(ByteView stored, int slot, ByteView value, const Schema& schema);

// The stored form of a type's empty value (Pop-Up "No Value", Time "No
// Time", Date "NO DATE", empty texts, zero numbers, no picture).
Bytes EmptyStoredValue(FieldType type);

}  // namespace cx
