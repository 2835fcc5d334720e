#include "engine/schema.h"

#include <algorithm>
#include <cstring>

#include "engine/byte_order.h"

namespace cx {
namespace {

// The two constants of a calculated field share the 20-byte text slot:
// bytes 0-8 and 9-18; byte 19 is the result format.
constexpr size_t kConst1 = 0, kConst1Size = 9;
constexpr size_t kConst2 = 9, kConst2Size = 10;

std::string SubText(const FixedText<20>& t, size_t at, size_t size) {
  const uint8_t* p = t.bytes.data() + at;
  size_t len = 0;
  while (len < size && p[len]) ++len;
  return std::string(reinterpret_cast<const char*>(p), len);
}

void SetSubText(FixedText<20>& t, size_t at, size_t size, const std::string& s) {
  uint8_t* p = t.bytes.data() + at;
  std::memset(p, 0, size);
  std::memcpy(p, s.data(), std::min(s.size(), std::min<size_t>(size - 1, 8)));
}

template <size_t N>
void GetText(GetCursor& in, FixedText<N>& t) {
  in.Raw(t.bytes.data(), N);
}
template <size_t N>
void PutText(PutCursor& out, const FixedText<N>& t) {
  out.Raw(t.bytes.data(), N);
}

void ReadFilter(GetCursor& in, FilterBlock& f) {
  f.field = in.I16();
  f.mode = in.I16();
  GetText(in, f.text1);
  GetText(in, f.text2);
  f.low = in.U32();
  f.high = in.U32();
}

void WriteFilter(PutCursor& out, const FilterBlock& f) {
  out.U16(static_cast<uint16_t>(f.field));
  out.U16(static_cast<uint16_t>(f.mode));
  PutText(out, f.text1);
  PutText(out, f.text2);
  out.U32(f.low);
  out.U32(f.high);
}

void ReadField(GetCursor& in, FieldDef& d) {
  d.typeNumber = in.I16();
  d.size = in.I16();
  d.popupsAppend = in.U8();
  d.behavior = in.U8();
  d.width = in.I16();
  d.exportPrint = in.U8();
  d.visible = in.U8();
  d.calcFlags = in.U8();
  d.calcOperation = in.U8();
  d.param1 = in.U8();
  d.param2 = in.U8();
  GetText(in, d.text);
  d.param3 = in.U8();
  d.otherField = in.U8();
  GetText(in, d.name);
}

void WriteField(PutCursor& out, const FieldDef& d) {
  out.U16(static_cast<uint16_t>(d.typeNumber));
  out.U16(static_cast<uint16_t>(d.size));
  out.U8(d.popupsAppend);
  out.U8(d.behavior);
  out.U16(static_cast<uint16_t>(d.width));
  out.U8(d.exportPrint);
  out.U8(d.visible);
  out.U8(d.calcFlags);
  out.U8(d.calcOperation);
  out.U8(d.param1);
  out.U8(d.param2);
  PutText(out, d.text);
  out.U8(d.param3);
  out.U8(d.otherField);
  PutText(out, d.name);
}

// An older layout is brought up to the current one; the settings that did
// not exist then get their neutral values.
void Upgrade(Schema& s) {
  for (FieldDef& d : s.field) {
    d.popupsAppend = d.type() == FieldType::Note ? 1 : 0;
    if (d.visible) d.exportPrint = 1;
    d.calcFlags = 0;
    d.param3 = 0;
    if (d.type() == FieldType::Float) d.size = 4;
    if (d.type() == FieldType::PopUp) d.param1 = 0;
  }
  s.setting200 = 0;
  s.securityLevels = 0;
  s.viewValue2 = 0;
  s.findOption2 = 0;
  s.resortPending = 0;
  s.recalcFrom = 0;
  if (!s.password.empty()) {
    // "Open Database" (0) and "DB Properties" (4) become "Password Required".
    s.securityLevels = static_cast<uint16_t>((1u << 0) | (1u << 8));
  }
  s.author.clear();
  s.comments.clear();
  s.schemaVersion = format::kSchemaVersion;
}

}  // namespace

std::string FieldDef::Constant1() const { return SubText(text, kConst1, kConst1Size); }
std::string FieldDef::Constant2() const { return SubText(text, kConst2, kConst2Size); }
void FieldDef::SetConstant1(const std::string& s) { SetSubText(text, kConst1, kConst1Size, s); }
void FieldDef::SetConstant2(const std::string& s) { SetSubText(text, kConst2, kConst2Size, s); }

Schema InitSchema() {
  Schema s;
  for (int i = 0; i < format::kFieldCount; ++i) {
    s.field[i].name.set("Field " + std::to_string(i + 1));
    s.fieldOrder[i] = static_cast<uint8_t>(i);
  }
  return s;
}

bool IsValidFieldOrder(std::span<const uint8_t> order) {
  if (order.size() != format::kFieldCount) return false;
  bool seen[format::kFieldCount] = {};
  for (uint8_t slot : order) {
    if (slot >= format::kFieldCount || seen[slot]) return false;
    seen[slot] = true;
  }
  return true;
}

bool ReadSchema(std::span<const uint8_t> record, Schema& s) {
  GetCursor in(record.data(), record.size());
  s.formatWord = in.U32();
  ReadFilter(in, s.filter[0]);
  ReadFilter(in, s.filter[1]);
  for (SortKey& k : s.sortKey) {
    k.field = in.U8();
    k.direction = in.U8();
  }
  s.sortOption1 = in.U8();
  s.sortOption2 = in.U8();
  s.listValue1 = in.I16();
  s.listValue2 = in.I16();
  s.setting200 = in.U8();
  s.setting201 = in.U8();
  GetText(in, s.password);
  for (FieldDef& d : s.field) ReadField(in, d);
  s.findField = in.U8();
  s.findOption1 = in.U8();
  GetText(in, s.findText);
  s.findOption2 = in.U8();
  s.recordExtension = in.I16();
  s.viewValue2 = in.I16();
  s.viewValue3 = in.I16();
  s.schemaVersion = in.U8();
  s.resortPending = in.U8();
  in.Raw(s.fieldOrder.data(), s.fieldOrder.size());
  in.Raw(s.fieldFlagsA.data(), s.fieldFlagsA.size());
  in.Raw(s.fieldFlagsB.data(), s.fieldFlagsB.size());
  if (s.schemaVersion >= 2) {
    s.securityLevels = in.U16();
    GetText(in, s.author);
    GetText(in, s.comments);
    s.recalcFrom = in.U16();
  } else {
    s.securityLevels = 0;
    s.author.clear();
    s.comments.clear();
    s.recalcFrom = 0;
  }
  if (in.failed()) return false;

  for (uint8_t& slot : s.fieldOrder) {
    if (slot >= format::kFieldCount) slot = 0;
  }
  if (!IsValidFieldOrder(s.fieldOrder)) {
    for (int i = 0; i < format::kFieldCount; ++i) s.fieldOrder[i] = static_cast<uint8_t>(i);
  }
  if (s.schemaVersion != format::kSchemaVersion) Upgrade(s);
  if (s.viewValue2 > 78 || s.viewValue2 < -70) s.viewValue2 = 0;
  return true;
}

std::vector<uint8_t> WriteSchema(const Schema& s) {
  std::vector<uint8_t> bytes;
  bytes.reserve(format::kSchemaSize);
  PutCursor out(bytes);
  out.U32(s.formatWord);
  WriteFilter(out, s.filter[0]);
  WriteFilter(out, s.filter[1]);
  for (const SortKey& k : s.sortKey) {
    out.U8(k.field);
    out.U8(k.direction);
  }
  out.U8(s.sortOption1);
  out.U8(s.sortOption2);
  out.U16(static_cast<uint16_t>(s.listValue1));
  out.U16(static_cast<uint16_t>(s.listValue2));
  out.U8(s.setting200);
  out.U8(s.setting201);
  PutText(out, s.password);
  for (const FieldDef& d : s.field) WriteField(out, d);
  out.U8(s.findField);
  out.U8(s.findOption1);
  PutText(out, s.findText);
  out.U8(s.findOption2);
  out.U16(static_cast<uint16_t>(s.recordExtension));
  out.U16(static_cast<uint16_t>(s.viewValue2));
  out.U16(static_cast<uint16_t>(s.viewValue3));
  out.U8(s.schemaVersion);
  out.U8(s.resortPending);
  out.Raw(s.fieldOrder.data(), s.fieldOrder.size());
  out.Raw(s.fieldFlagsA.data(), s.fieldFlagsA.size());
  out.Raw(s.fieldFlagsB.data(), s.fieldFlagsB.size());
  out.U16(s.securityLevels);
  PutText(out, s.author);
  PutText(out, s.comments);
  out.U16(s.recalcFrom);
  return bytes;
}

}  // namespace cx
