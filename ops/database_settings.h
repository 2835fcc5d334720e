// The view settings each database carries in its schema record: the two
// filters with their combination flags, the search settings, and the
// per-field "Sort Popups" flag. docs/file-format.md documents where each
// one lives; every byte that is not one of these settings is written back
// exactly as it was read.
#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "engine/schema.h"

namespace cx {

// One filter. `lower` and `upper` hold text (zero-terminated) for text and
// decimal limits, or a day number (4 bytes, least significant first) or a
// time (seconds, minutes, hours) in their first bytes.
struct Filter {
  bool enabled = false;
  int field = 0;
  std::array<uint8_t, 40> lower{};
  std::array<uint8_t, 40> upper{};
  int32_t lowerNumber = 0;
  int32_t upperNumber = 65000;

  std::string LowerText() const;
  std::string UpperText() const;
  void SetLowerText(const std::string& text);
  void SetUpperText(const std::string& text);
  uint32_t LowerDay() const;
  uint32_t UpperDay() const;
  void SetLowerDay(uint32_t day);
  void SetUpperDay(uint32_t day);
  // Times as one 24-bit number, seconds in the low byte.
  uint32_t LowerTime() const;
  uint32_t UpperTime() const;
  void SetLowerTime(uint8_t hours, uint8_t minutes, uint8_t seconds);
  void SetUpperTime(uint8_t hours, uint8_t minutes, uint8_t seconds);
};

// Bits of the combination flags.
inline constexpr uint8_t kFilterNot1 = 1;  // "NOT" of filter 1
inline constexpr uint8_t kFilterOr = 2;    // OR between the filters (clear: AND)
inline constexpr uint8_t kFilterNot2 = 4;  // "NOT" of filter 2

struct FilterSettings {
  std::array<Filter, 2> filter{};
  uint8_t combination = 0;

  bool Not(int n) const { return (combination & (n == 0 ? kFilterNot1 : kFilterNot2)) != 0; }
  bool UsesOr() const { return (combination & kFilterOr) != 0; }
  bool AnyEnabled() const { return filter[0].enabled || filter[1].enabled; }
};

FilterSettings LoadFilterSettings(const Schema& schema);
// Writes the settings back, changing only the bits and bytes they occupy.
void StoreFilterSettings(const FilterSettings& settings, Schema& schema);

// The search ("Search Database") settings.
struct SearchSettings {
  int field = -1;  // -1: "Search All Fields"
  bool caseSensitive = false;
  std::string text;  // at most 34 characters are kept
  bool beginsWith = false;
};

SearchSettings LoadSearchSettings(const Schema& schema);
void StoreSearchSettings(const SearchSettings& settings, Schema& schema);

// The popup list editor's "Sort Popups" flag of a field slot.
bool SortPopupsOn(const Schema& schema, int field);
void SetSortPopups(Schema& schema, int field, bool on);

}  // namespace cx
