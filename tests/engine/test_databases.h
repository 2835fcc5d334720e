// Database files and records laid out byte by byte, independently of the
// engine's writers, so that tests can build both what the engine writes and
// what it never would.
#pragma once

#include <cstdint>
#include <fstream>
#include <initializer_list>
#include <iterator>
#include <optional>
#include <string>
#include <vector>

#include "engine/container.h"
#include "engine/schema.h"

namespace cx::testing {

using ByteVector = std::vector<uint8_t>;

inline void AppendBE(ByteVector& out, uint32_t value, int width) {
  for (int shift = 8 * (width - 1); shift >= 0; shift -= 8) out.push_back(uint8_t(value >> shift));
}

inline uint32_t ReadBE(const ByteVector& in, size_t at, int width) {
  uint32_t v = 0;
  for (int i = 0; i < width; ++i) v = (v << 8) | in.at(at + i);
  return v;
}

// A stored data record assembled slot by slot.
class SlotWriter {
 public:
  explicit SlotWriter(bool extension = false) {
    bytes.push_back(extension ? 1 : 0);
    if (extension) bytes.insert(bytes.end(), 20, 0);
  }
  SlotWriter& Raw(const ByteVector& value) {
    Length(value.size());
    bytes.insert(bytes.end(), value.begin(), value.end());
    return *this;
  }
  SlotWriter& Text(const std::string& text) {
    ByteVector v(text.begin(), text.end());
    v.push_back(0);
    return Raw(v);
  }
  SlotWriter& Number(uint32_t n) {
    return Raw({uint8_t(n), uint8_t(n >> 8), uint8_t(n >> 16), uint8_t(n >> 24)});
  }
  SlotWriter& Byte(uint8_t b) { return Raw({b}); }
  SlotWriter& Empty() { return Raw({}); }
  SlotWriter& End() {
    bytes.push_back(0xFF);
    bytes.push_back(0xFF);
    return *this;
  }
  SlotWriter& Length(size_t n) {
    bytes.push_back(uint8_t(n));
    bytes.push_back(uint8_t(n >> 8));
    return *this;
  }

  ByteVector bytes;
};

// Slot i of the returned schema has the i-th type given; the rest Not-Used.
inline Schema SchemaOf(std::initializer_list<FieldType> types) {
  Schema s = InitSchema();
  int slot = 0;
  for (FieldType t : types) s.field[slot++].typeNumber = static_cast<int16_t>(t);
  return s;
}

// One slot of every type, in a fixed order the tests rely on:
// 0 Text, 1 Integer, 2 Float (2 places), 3 Pop-Up, 4 Check-Box, 5 Unique,
// 6 Image, 7 Date, 8 Time, 9 Link, 10 Linked, 11 Note, 12 Heading,
// 13 DB Popup, 14-17 Calculated with result formats 2, 3, 5 and 7.
inline Schema EveryTypeSchema() {
  Schema s = SchemaOf({FieldType::Text, FieldType::Integer, FieldType::Float, FieldType::PopUp,
                       FieldType::CheckBox, FieldType::Unique, FieldType::Image, FieldType::Date,
                       FieldType::Time, FieldType::Link, FieldType::Linked, FieldType::Note,
                       FieldType::Heading, FieldType::DBPopup, FieldType::Calculated,
                       FieldType::Calculated, FieldType::Calculated, FieldType::Calculated});
  s.field[2].size = 2;
  s.field[13].size = 30;
  s.field[14].setResultFormat(2);
  s.field[15].setResultFormat(3);
  s.field[16].setResultFormat(5);
  s.field[17].setResultFormat(7);
  return s;
}

struct RawRecord {
  ByteVector bytes;
  uint8_t attributes = 0;
  uint32_t uniqueID = 0;
};

// The schema record followed by 30 empty popup lists.
inline std::vector<RawRecord> StandardRecords(const Schema& schema = InitSchema()) {
  std::vector<RawRecord> records;
  records.push_back({WriteSchema(schema), 0, 0});
  for (int i = 0; i < 30; ++i) records.push_back({ByteVector(3, 0), 0, 0});
  return records;
}

constexpr size_t EntryAt(size_t index) { return 78 + 8 * index; }

// A whole file in the engine's layout: header, entries, two zero bytes, a
// 40-byte zero block, then the records. `numRecords` overrides the count
// written in the header (the entry list still holds every record given).
inline ByteVector BuildPdb(const std::vector<RawRecord>& records, const Header& header,
                           std::optional<uint16_t> numRecords = std::nullopt) {
  ByteVector out;
  out.insert(out.end(), header.name.begin(), header.name.end());
  AppendBE(out, header.attributes, 2);
  AppendBE(out, header.version, 2);
  AppendBE(out, header.creationDate, 4);
  AppendBE(out, header.modificationDate, 4);
  AppendBE(out, header.lastBackupDate, 4);
  AppendBE(out, header.modificationNumber, 4);
  AppendBE(out, uint32_t(80 + 8 * records.size()), 4);
  AppendBE(out, header.sortInfoID, 4);
  AppendBE(out, header.type, 4);
  AppendBE(out, header.creator, 4);
  AppendBE(out, header.uniqueIDSeed, 4);
  AppendBE(out, header.nextRecordListID, 4);
  AppendBE(out, numRecords.value_or(uint16_t(records.size())), 2);
  uint32_t offset = uint32_t(80 + 8 * records.size() + 40);
  for (const RawRecord& r : records) {
    AppendBE(out, offset, 4);
    out.push_back(r.attributes);
    AppendBE(out, r.uniqueID, 3);
    offset += uint32_t(r.bytes.size());
  }
  out.insert(out.end(), 42, 0);
  for (const RawRecord& r : records) out.insert(out.end(), r.bytes.begin(), r.bytes.end());
  return out;
}

inline ByteVector BuildPdb(const std::vector<RawRecord>& records) {
  return BuildPdb(records, InitHeader("Test"));
}

inline uint32_t EntryOffset(const ByteVector& file, size_t index) {
  return ReadBE(file, EntryAt(index), 4);
}
inline void SetEntryOffset(ByteVector& file, size_t index, uint32_t offset) {
  for (int i = 0; i < 4; ++i) file.at(EntryAt(index) + i) = uint8_t(offset >> (24 - 8 * i));
}

inline bool WriteBytes(const std::string& path, const ByteVector& bytes) {
  std::ofstream f(path, std::ios::binary | std::ios::trunc);
  f.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
  return static_cast<bool>(f);
}

inline ByteVector ReadBytes(const std::string& path) {
  std::ifstream f(path, std::ios::binary);
  return ByteVector(std::istreambuf_iterator<char>(f), std::istreambuf_iterator<char>());
}

}  // namespace cx::testing
