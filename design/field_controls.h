// Which controls of the "Edit Field" dialog belong to which field type, and
// the texts of its lists: data for the dialog to show, kept here so that the
// rules are tested without a window.
#pragma once

#include <array>
#include <string_view>

#include "engine/field_types.h"

namespace cx {

struct FieldControls {
  bool pixelsShown = false;
  bool maxCharacters = false;
  bool editPopups = false;    // the "Edit Popups" button
  bool popupsAppend = false;  // the "Popups Append" check
  bool otherDatabase = false; // "Other Database" and "Other Field #"
  bool placesAfterDecimal = false;
  bool defaultValue = false;
  bool dateBehavior = false;
  bool timeBehavior = false;
  bool showValueFrom = false;
  bool group = false;         // "Group (0=none)"
  bool calc = false;          // Value 1, Operation, Value 2, constants, Prev Record, Result Format
  bool visible = false;
  bool exportPrint = false;
  bool operator==(const FieldControls&) const = default;
};

// The controls shown for a type.
FieldControls ControlsForType(FieldType type);

// Within the calculated controls: a value list showing "No Field" shows its
// constant edit and hides its "Prev Record" check; naming a field, the
// other way round.
struct OperandControls {
  bool constant = false;
  bool prevRecord = false;
};
OperandControls ControlsForOperand(int listIndex);

inline constexpr std::array<std::string_view, 4> kDateBehaviors = {
    "Ask User for Date", "Date Record Added", "Date Record Modified", "Current Date"};
inline constexpr std::array<std::string_view, 3> kTimeBehaviors = {
    "Ask User for Time", "Time Record Added", "Time Record Modified"};
inline constexpr std::array<std::string_view, 7> kCalcOperations = {"+",   "-",   "*",      "/",
                                                                    "Min", "Max", "Average"};
inline constexpr std::array<std::string_view, 7> kResultFormats = {
    "To 4 Decimal Places", "Integer",
    "Time",                "Date",
    "To 3 Decimal Places", "To 2 Decimal Places",
    "To 1 Decimal Place"};
inline constexpr std::array<std::string_view, 5> kDecimalPlaces = {"0", "1", "2", "3", "4"};
inline constexpr std::string_view kNoField = "No Field";
inline constexpr std::string_view kNoValue = "No Value";

}  // namespace cx
