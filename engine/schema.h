// The schema record (record 0): the 30 field definitions and the settings
// each database carries. Every byte of the record has a member here, so a
// record read and written again is unchanged.
#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "engine/field_types.h"
#include "engine/fixed_text.h"
#include "engine/format.h"

namespace cx {

struct FilterBlock {
  int16_t field = 0;
  int16_t mode = 0;
  FixedText<40> text1;
  FixedText<40> text2;
  uint32_t low = 0;
  uint32_t high = 65000;
  bool operator==(const FilterBlock&) const = default;
};

struct SortKey {
  uint8_t field = 255;  // slot; 255 (read as signed: -1) = no key
  uint8_t direction = 1;  // 1 forward, 0 reverse
  // The slot as the signed byte it is read as (-1 for none).
  int Field() const { return static_cast<int8_t>(field); }
  bool operator==(const SortKey&) const = default;
};

struct FieldDef {
  int16_t typeNumber = 0;
  int16_t size = 40;
  uint8_t popupsAppend = 0;
  uint8_t behavior = 1;
  int16_t width = 58;
  uint8_t exportPrint = 1;
  uint8_t visible = 1;
  uint8_t calcFlags = 0;
  uint8_t calcOperation = 0;
  uint8_t param1 = 0;
  uint8_t param2 = 0;
  FixedText<20> text;  // other database's name, or the calculated constants
  uint8_t param3 = 0;
  uint8_t otherField = 255;
  FixedText<20> name;

  FieldType type() const { return TypeFromNumber(typeNumber); }
  // Float: places after the decimal point, 0 to 4 (out of range reads 4).
  int Places() const { return size >= 0 && size <= 4 ? size : 4; }
  // Calculated: the result format kept in the last byte of the text slot,
  // and the two constants that share the slot.
  uint8_t resultFormat() const { return text.bytes[19]; }
  void setResultFormat(uint8_t f) { text.bytes[19] = f; }
  std::string Constant1() const;
  std::string Constant2() const;
  void SetConstant1(const std::string& s);
  void SetConstant2(const std::string& s);
  bool operator==(const FieldDef&) const = default;
};

struct Schema {
  uint32_t formatWord = 1;
  std::array<FilterBlock, 2> filter{};
  std::array<SortKey, 3> sortKey{};
  uint8_t sortOption1 = 255;
  uint8_t sortOption2 = 1;
  int16_t listValue1 = 31;
  int16_t listValue2 = 0;
  uint8_t setting200 = 1;
  uint8_t setting201 = 1;
  FixedText<20> password;
  std::array<FieldDef, format::kFieldCount> field{};
  uint8_t findField = 255;
  uint8_t findOption1 = 0;
  FixedText<35> findText;
  uint8_t findOption2 = 0;
  int16_t recordExtension = 0;
  int16_t viewValue2 = 0;
  int16_t viewValue3 = 0;
  uint8_t schemaVersion = format::kSchemaVersion;
  uint8_t resortPending = 0;
  std::array<uint8_t, format::kFieldCount> fieldOrder{};
  std::array<uint8_t, format::kFieldCount> fieldFlagsA{};
  std::array<uint8_t, format::kFieldCount> fieldFlagsB{};
  uint16_t securityLevels = 0;
  FixedText<40> author;
  FixedText<70> comments;
  uint16_t recalcFrom = 0;

  bool operator==(const Schema&) const = default;
};

// The defaults of a new database: every field Not-Used and named "Field 1"
// to "Field 30", identity display order, no sort keys.
Schema InitSchema();

// ReadSchema: decodes record 0 and applies the load rules (field order
// repair, the upgrade of older layouts, the viewValue2 clamp). False when
// the record is too short for its layout version.
bool ReadSchema(std::span<const uint8_t> record, Schema& schema);

// WriteSchema: the record in the current layout, exactly 2152 bytes.
std::vector<uint8_t> WriteSchema(const Schema& schema);

// A display order is valid when it holds each slot number 0 to 29 once.
bool IsValidFieldOrder(std::span<const uint8_t> order);

}  // namespace cx
