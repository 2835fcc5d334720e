// Field types, numbered as stored in files.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace cx {

enum class FieldType : int16_t {
  NotUsed = 0,
  Text = 1,
  Integer = 2,
  Float = 3,
  PopUp = 4,
  CheckBox = 5,
  Unique = 6,
  Image = 7,
  Date = 8,
  Time = 9,
  Link = 10,
  Linked = 11,
  Note = 12,
  Heading = 13,
  DBPopup = 14,
  Calculated = 15,
};

constexpr int kFieldTypeCount = 16;

// Any stored number of 16 or more (or below 0) reads as Not-Used.
inline FieldType TypeFromNumber(int number) {
  return number >= 0 && number < kFieldTypeCount ? static_cast<FieldType>(number)
                                                 : FieldType::NotUsed;
}

// The label of the type list ("Not-Used", "Text", ..., "Calculated").
std::string_view FieldTypeLabel(FieldType type);
// Case-insensitive lookup of a label; also accepts the label without
// punctuation ("popup", "checkbox", "dbpopup", "notused").
std::optional<FieldType> FieldTypeFromLabel(std::string_view label);

// Letters and digits of `label`, lower-cased: "Edit Records",
// "edit-records" and "editrecords" all give "editrecords". Used to accept
// labels typed in scripts.
std::string SimplifiedLabel(std::string_view label);

// Calculated fields: byte 33 of the field's text slot.
enum class ResultFormat : uint8_t {
  FourPlaces = 0,
  Integer = 1,
  Time = 2,
  Date = 3,
  ThreePlaces = 4,
  TwoPlaces = 5,
  OnePlace = 6,
};

}  // namespace cx
