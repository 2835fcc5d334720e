#include "ops/database_settings.h"

#include <algorithm>
#include <cstring>

#include "engine/byte_order.h"

namespace cx {
namespace {

// Bits of a filter block's `mode` word. The OR bit is read from and written
// to the first block only; every other bit is kept as read.
constexpr uint16_t kModeEnabled = 1;
constexpr uint16_t kModeNot = 2;
constexpr uint16_t kModeOr = 4;

std::string Text40(const std::array<uint8_t, 40>& bytes) {
  const void* nul = std::memchr(bytes.data(), 0, bytes.size());
  size_t len = nul ? static_cast<const uint8_t*>(nul) - bytes.data() : bytes.size();
  return std::string(reinterpret_cast<const char*>(bytes.data()), len);
}

void SetText40(std::array<uint8_t, 40>& bytes, const std::string& text) {
  bytes.fill(0);
  std::memcpy(bytes.data(), text.data(), std::min(text.size(), bytes.size() - 1));
}

uint32_t Time3(const std::array<uint8_t, 40>& b) {
  return uint32_t(b[0]) | (uint32_t(b[1]) << 8) | (uint32_t(b[2]) << 16);
}

void SetTime3(std::array<uint8_t, 40>& b, uint8_t hours, uint8_t minutes, uint8_t seconds) {
  b[0] = seconds;
  b[1] = minutes;
  b[2] = hours;
}

uint16_t WithBit(uint16_t word, uint16_t bit, bool on) {
  return static_cast<uint16_t>(on ? (word | bit) : (word & ~bit));
}

}  // namespace

std::string Filter::LowerText() const { return Text40(lower); }
std::string Filter::UpperText() const { return Text40(upper); }
void Filter::SetLowerText(const std::string& text) { SetText40(lower, text); }
void Filter::SetUpperText(const std::string& text) { SetText40(upper, text); }
uint32_t Filter::LowerDay() const { return GetLE32(lower.data()); }
uint32_t Filter::UpperDay() const { return GetLE32(upper.data()); }
void Filter::SetLowerDay(uint32_t day) { PutLE32(lower.data(), day); }
void Filter::SetUpperDay(uint32_t day) { PutLE32(upper.data(), day); }
uint32_t Filter::LowerTime() const { return Time3(lower); }
uint32_t Filter::UpperTime() const { return Time3(upper); }
void Filter::SetLowerTime(uint8_t h, uint8_t m, uint8_t s) { SetTime3(lower, h, m, s); }
void Filter::SetUpperTime(uint8_t h, uint8_t m, uint8_t s) { SetTime3(upper, h, m, s); }

FilterSettings LoadFilterSettings(const Schema& schema) {
  FilterSettings out;
  for (int n = 0; n < 2; ++n) {
    const FilterBlock& block = schema.filter[n];
    Filter& f = out.filter[n];
    const uint16_t mode = static_cast<uint16_t>(block.mode);
    f.enabled = (mode & kModeEnabled) != 0;
    f.field = block.field;
    f.lower = block.text1.bytes;
    f.upper = block.text2.bytes;
    f.lowerNumber = static_cast<int32_t>(block.low);
    f.upperNumber = static_cast<int32_t>(block.high);
    if (mode & kModeNot) out.combination |= n == 0 ? kFilterNot1 : kFilterNot2;
  }
  if (static_cast<uint16_t>(schema.filter[0].mode) & kModeOr) out.combination |= kFilterOr;
  return out;
}

void StoreFilterSettings(const FilterSettings& settings, Schema& schema) {
  for (int n = 0; n < 2; ++n) {
    FilterBlock& block = schema.filter[n];
    const Filter& f = settings.filter[n];
    uint16_t mode = static_cast<uint16_t>(block.mode);
    mode = WithBit(mode, kModeEnabled, f.enabled);
    mode = WithBit(mode, kModeNot, settings.Not(n));
    if (n == 0) mode = WithBit(mode, kModeOr, settings.UsesOr());
    block.mode = static_cast<int16_t>(mode);
    block.field = static_cast<int16_t>(f.field);
    block.text1.bytes = f.lower;
    block.text2.bytes = f.upper;
    block.low = static_cast<uint32_t>(f.lowerNumber);
    block.high = static_cast<uint32_t>(f.upperNumber);
  }
}

SearchSettings LoadSearchSettings(const Schema& schema) {
  SearchSettings out;
  out.field = static_cast<int8_t>(schema.findField);
  out.caseSensitive = schema.findOption1 != 0;
  out.text = schema.findText.str();
  out.beginsWith = schema.findOption2 != 0;
  return out;
}

void StoreSearchSettings(const SearchSettings& settings, Schema& schema) {
  schema.findField = static_cast<uint8_t>(static_cast<int8_t>(settings.field));
  // A flag byte that already says the same thing keeps its value.
  if ((schema.findOption1 != 0) != settings.caseSensitive) schema.findOption1 = settings.caseSensitive;
  if ((schema.findOption2 != 0) != settings.beginsWith) schema.findOption2 = settings.beginsWith;
  if (schema.findText.str() != settings.text) schema.findText.set(settings.text);
}

bool SortPopupsOn(const Schema& schema, int field) {
  return field >= 0 && field < format::kFieldCount && schema.fieldFlagsA[field] != 0;
}

void SetSortPopups(Schema& schema, int field, bool on) {
  if (field < 0 || field >= format::kFieldCount) return;
  if ((schema.fieldFlagsA[field] != 0) != on) schema.fieldFlagsA[field] = on;
}

}  // namespace cx
