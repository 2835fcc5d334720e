// A small in-memory database for the sorting, filter, find and calculation
// tests: fields are declared one by one and records are built from
// (slot, value) pairs through the engine's editing form, or byte by byte
// when a test needs a record no editor would write.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <vector>

#include "engine/byte_order.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "ops/session.h"
#include "platform/locale_info.h"
#include "tests/support/test_support.h"

namespace cx::testing {

// One value of a record under construction.
struct Val {
  enum Kind { kText, kNumber, kByte, kTime } kind;
  int slot;
  std::string text;
  uint32_t number = 0;
};
inline Val Text(int slot, std::string text) { return {Val::kText, slot, std::move(text)}; }
inline Val Num(int slot, uint32_t n) { return {Val::kNumber, slot, {}, n}; }
inline Val Byte(int slot, uint8_t b) { return {Val::kByte, slot, {}, b}; }
inline Val TimeVal(int slot, int hours, int minutes, int seconds) {
  return {Val::kTime, slot, {}, uint32_t(seconds) | (uint32_t(minutes) << 8) | (uint32_t(hours) << 16)};
}

class TestDb {
 public:
  TestDb() : db(Database::CreateNew("/nonexistent/Test.PDB", "Test")), session(db, locale, ui) {}

  // Declares the next free slot; returns its number.
  int Field(FieldType type, const std::string& name, int size = 40) {
    const int slot = next_++;
    FieldDef& d = db.schema().field[slot];
    d.typeNumber = static_cast<int16_t>(type);
    d.name.set(name);
    d.size = static_cast<int16_t>(size);
    return slot;
  }
  // A Calculated field: operands are slots (255 = constant), `flags` the
  // Prev Record bits.
  int Calc(const std::string& name, int op, int format, int v1, int v2, uint8_t flags = 0,
           const std::string& c1 = "", const std::string& c2 = "") {
    const int slot = Field(FieldType::Calculated, name);
    FieldDef& d = db.schema().field[slot];
    d.calcOperation = static_cast<uint8_t>(op);
    d.setResultFormat(static_cast<uint8_t>(format));
    d.param1 = static_cast<uint8_t>(v1);
    d.param2 = static_cast<uint8_t>(v2);
    d.calcFlags = flags;
    d.SetConstant1(c1);
    d.SetConstant2(c2);
    return slot;
  }

  Bytes Build(std::initializer_list<Val> values) const {
    const Schema& s = db.schema();
    Bytes e = NewEditingRecord(s);
    for (const Val& v : values) {
      switch (v.kind) {
        case Val::kText: SetEditingText(e, v.slot, v.text, s); break;
        case Val::kNumber:
        case Val::kTime: SetEditingNumber(e, v.slot, v.number, s); break;
        case Val::kByte: SetEditingByte(e, v.slot, static_cast<uint8_t>(v.number), s); break;
      }
    }
    return Compact(e, s);
  }
  // Appends a record; its unique id is its position at creation, so tests
  // can follow records through a sort.
  void Add(std::initializer_list<Val> values) {
    db.AppendRecord(Build(values), 0, static_cast<uint32_t>(db.recordCount()));
  }

  // The text value of a slot of record `index` (empty when missing).
  std::string TextAt(size_t index, int slot) const {
    auto v = FieldValue(db.record(index), slot);
    return v ? ValueString(*v) : std::string("<missing>");
  }
  uint32_t NumberAt(size_t index, int slot) const {
    auto v = FieldValue(db.record(index), slot);
    return v ? ValueNumber(*v) : 0xDEADBEEF;
  }
  std::vector<uint32_t> Ids() const {
    std::vector<uint32_t> ids;
    for (size_t i = 0; i < db.recordCount(); ++i) ids.push_back(db.entry(i).uniqueID());
    return ids;
  }

  LocaleInfo locale;
  ScriptedUi ui;
  Database db;
  DataSession session;

 private:
  int next_ = 0;
};

// A stored record written slot by slot: each entry is one slot's value
// bytes; the record ends after them with the end mark.
inline Bytes RawRecord(const std::vector<Bytes>& slots, bool endMark = true) {
  Bytes r{0};
  for (const Bytes& v : slots) {
    uint8_t len[2];
    PutLE16(len, static_cast<uint16_t>(v.size()));
    r.insert(r.end(), len, len + 2);
    r.insert(r.end(), v.begin(), v.end());
  }
  if (endMark) {
    r.push_back(0xFF);
    r.push_back(0xFF);
  }
  return r;
}

inline Bytes Le32(uint32_t n) {
  Bytes b(4);
  PutLE32(b.data(), n);
  return b;
}

inline Bytes Str(const std::string& s) {
  Bytes b(s.begin(), s.end());
  b.push_back(0);
  return b;
}

}  // namespace cx::testing
