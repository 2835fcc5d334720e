#include "engine/record.h"

#include <algorithm>
#include <cstring>
#include <limits>

#include "engine/byte_order.h"

namespace cx {
namespace {

constexpr int kNumberText = 15;
constexpr int kImageSize = 2001;
constexpr int kLinkedBlock = 24;
constexpr int kLinkedCapacity = 280;
constexpr int kNoteCapacity = 2000;

bool IsUsed(int typeNumber) { return typeNumber >= 1 && typeNumber <= 15; }

size_t PrefixSize(const Schema& schema) {
  return schema.recordExtension != 0 ? 1 + format::kExtensionSize : 1;
}

size_t TextLength(const uint8_t* p, size_t capacity) {
  const void* nul = std::memchr(p, 0, capacity);
  return nul ? static_cast<const uint8_t*>(nul) - p : capacity;
}

size_t LinkedTextLength(const uint8_t* v, size_t cap) {
  return cap > kLinkedBlock ? TextLength(v + kLinkedBlock, cap - kLinkedBlock) : 0;
}

bool UsedSlotFollows(const Schema& schema, int slot) {
  for (int j = slot + 1; j < format::kFieldCount; ++j) {
    if (IsUsed(schema.field[j].typeNumber)) return true;
  }
  return false;
}

// Offset of a slot's length bytes in an editing record (every slot present).
size_t EditingSlotOffset(ByteView editing, int fieldSlot) {
  size_t off = DataStart(editing);
  for (int i = 0; i < fieldSlot; ++i) off += 2 + GetLE16(editing.data() + off);
  return off;
}

}  // namespace

size_t DataStart(ByteView record) {
  return !record.empty() && record[0] != 0 ? 1 + format::kExtensionSize : 1;
}

int FieldOffset(int fieldSlot, ByteView record) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount) return -1;
  size_t off = DataStart(record);
  for (int i = 0;; ++i) {
    if (off + 2 > record.size()) return -1;
    uint16_t len = GetLE16(record.data() + off);
    if (len == format::kEndMark) return -1;
    if (i == fieldSlot) return static_cast<int>(off + 2);
    off += 2 + len;
  }
}

int FieldLength(ByteView record, int fieldSlot) {
  int off = FieldOffset(fieldSlot, record);
  return off < 0 ? 0 : GetLE16(record.data() + off - 2);
}

std::optional<ByteView> FieldValue(ByteView record, int fieldSlot) {
  int off = FieldOffset(fieldSlot, record);
  if (off < 0) return std::nullopt;
  size_t len = GetLE16(record.data() + off - 2);
  size_t avail = record.size() - static_cast<size_t>(off);
  return record.subspan(static_cast<size_t>(off), std::min(len, avail));
}

std::array<std::optional<ByteView>, format::kFieldCount> FieldValues(ByteView record) {
  std::array<std::optional<ByteView>, format::kFieldCount> values{};
  size_t off = DataStart(record);
  for (int i = 0; i < format::kFieldCount; ++i) {
    if (off + 2 > record.size()) break;
    size_t len = GetLE16(record.data() + off);
    if (len == format::kEndMark) break;
    size_t avail = record.size() - (off + 2);
    values[i] = record.subspan(off + 2, std::min(len, avail));
    off += 2 + len;
  }
  return values;
}

bool RecordIsWellFormed(ByteView record) {
  if (record.empty()) return true;  // no slots at all: every value reads empty
  size_t off = DataStart(record);
  if (off > record.size()) return false;
  for (int i = 0; i < format::kFieldCount; ++i) {
    if (off + 2 > record.size()) return true;  // ends without a mark: allowed
    uint16_t len = GetLE16(record.data() + off);
    if (len == format::kEndMark) return true;
    if (off + 2 + len > record.size()) return false;
    off += 2 + len;
  }
  return true;
}

int EditingCapacity(const FieldDef& field) {
  switch (field.type()) {
    case FieldType::Text:
    case FieldType::DBPopup:
      return std::max<int>(field.size, 0) + 1;
    case FieldType::Integer:
    case FieldType::Float:
    case FieldType::Calculated:
      return kNumberText;
    case FieldType::PopUp:
    case FieldType::CheckBox:
      return 1;
    case FieldType::Unique:
    case FieldType::Date:
    case FieldType::Time:
    case FieldType::Link:
      return 4;
    case FieldType::Image:
      return kImageSize;
    case FieldType::Linked:
      return kLinkedCapacity;
    case FieldType::Note:
      return kNoteCapacity;
    case FieldType::NotUsed:
    case FieldType::Heading:
      return 0;
  }
  return 0;
}

size_t EditingSize(const Schema& schema) {
  size_t size = PrefixSize(schema);
  for (const FieldDef& f : schema.field) size += 2 + EditingCapacity(f);
  return size;
}

Bytes NewEditingRecord(const Schema& schema) {
  Bytes rec(EditingSize(schema), 0);
  if (schema.recordExtension != 0) rec[0] = 1;
  size_t off = PrefixSize(schema);
  for (const FieldDef& f : schema.field) {
    int cap = EditingCapacity(f);
    PutLE16(rec.data() + off, static_cast<uint16_t>(cap));
    off += 2 + cap;
  }
  return rec;
}

size_t StoredSize(ByteView editing, const Schema& schema) {
  size_t size = PrefixSize(schema);
  size_t off = DataStart(editing);
  for (int i = 0; i < format::kFieldCount; ++i) {
    const FieldDef& f = schema.field[i];
    const uint8_t* v = editing.data() + off + 2;
    size_t cap = GetLE16(editing.data() + off);
    off += 2 + cap;
    int type = f.typeNumber;
    if (type > 15) continue;
    switch (TypeFromNumber(type)) {
      case FieldType::NotUsed:
        size += 2;
        if (!UsedSlotFollows(schema, i)) return size;
        break;
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
        size += 2 + TextLength(v, cap) + 1;
        break;
      case FieldType::Float:
      case FieldType::Calculated:
        size += 2 + TextLength(v, cap ? cap - 1 : 0) + 1;
        break;
      case FieldType::Integer:
      case FieldType::Unique:
      case FieldType::Date:
      case FieldType::Time:
      case FieldType::Link:
        size += 6;
        break;
      case FieldType::PopUp:
      case FieldType::CheckBox:
        size += 3;
        break;
      case FieldType::Image:
        size += (cap && v[0] != 0) ? 2 + kImageSize : 3;
        break;
      case FieldType::Linked:
        size += 2 + kLinkedBlock + LinkedTextLength(v, cap) + 1;
        break;
      case FieldType::Heading:
        size += 2;
        break;
    }
  }
  return size;
}

Bytes Compact(ByteView editing, const Schema& schema) {
  Bytes out;
  out.reserve(StoredSize(editing, schema));
  if (schema.recordExtension != 0) {
    size_t n = std::min<size_t>(editing.size(), 1 + format::kExtensionSize);
    out.insert(out.end(), editing.begin(), editing.begin() + n);
    out.resize(1 + format::kExtensionSize, 0);
  } else {
    out.push_back(0);
  }
  auto putLength = [&out](size_t len) {
    out.push_back(uint8_t(len));
    out.push_back(uint8_t(len >> 8));
  };
  auto putText = [&](const uint8_t* p, size_t len) {
    putLength(len + 1);
    out.insert(out.end(), p, p + len);
    out.push_back(0);
  };
  size_t off = DataStart(editing);
  for (int i = 0; i < format::kFieldCount; ++i) {
    const FieldDef& f = schema.field[i];
    size_t cap = GetLE16(editing.data() + off);
    const uint8_t* v = editing.data() + off + 2;
    off += 2 + cap;
    if (f.typeNumber > 15) continue;  // such a slot is dropped from the stored form
    switch (TypeFromNumber(f.typeNumber)) {
      case FieldType::NotUsed:
        if (UsedSlotFollows(schema, i)) {
          putLength(0);
        } else {
          putLength(format::kEndMark);
          return out;
        }
        break;
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
        putText(v, TextLength(v, cap));
        break;
      case FieldType::Integer: {
        std::string text(reinterpret_cast<const char*>(v), TextLength(v, cap));
        uint8_t b[4];
        PutLE32(b, static_cast<uint32_t>(ParseLong(text)));
        putLength(4);
        out.insert(out.end(), b, b + 4);
        break;
      }
      case FieldType::Float:
      case FieldType::Calculated:
        putText(v, TextLength(v, cap ? cap - 1 : 0));
        break;
      case FieldType::PopUp:
      case FieldType::CheckBox:
        putLength(1);
        out.push_back(cap ? v[0] : 0);
        break;
      case FieldType::Unique:
      case FieldType::Link:
      case FieldType::Date:
      case FieldType::Time:
        putLength(4);
        for (size_t k = 0; k < 4; ++k) out.push_back(k < cap ? v[k] : 0);
        break;
      case FieldType::Image:
        if (cap && v[0] != 0) {
          putLength(kImageSize);
          out.insert(out.end(), v, v + std::min<size_t>(cap, kImageSize));
          out.resize(out.size() + (kImageSize - std::min<size_t>(cap, kImageSize)), 0);
        } else {
          putLength(1);
          out.push_back(0);
        }
        break;
      case FieldType::Linked: {
        size_t len = LinkedTextLength(v, cap);
        putLength(kLinkedBlock + len + 1);
        size_t block = std::min<size_t>(cap, kLinkedBlock);
        out.insert(out.end(), v, v + block);
        out.resize(out.size() + (kLinkedBlock - block), 0);
        out.insert(out.end(), v + block, v + block + len);
        out.push_back(0);
        break;
      }
      case FieldType::Heading:
        putLength(0);
        break;
    }
  }
  return out;
}

Bytes Expand(ByteView stored, const Schema& schema) {
  Bytes editing = NewEditingRecord(schema);
  if (schema.recordExtension != 0 && !stored.empty() && stored[0] != 0) {
    size_t n = std::min<size_t>(stored.size(), 1 + format::kExtensionSize);
    std::copy(stored.begin(), stored.begin() + n, editing.begin());
  }
  for (int i = 0; i < format::kFieldCount; ++i) {
    const FieldDef& f = schema.field[i];
    std::span<uint8_t> slot = EditingSlot(editing, i);
    if (slot.empty()) continue;
    std::optional<ByteView> value = FieldValue(stored, i);
    if (!value) continue;
    switch (f.type()) {
      case FieldType::Integer: {
        std::string text = std::to_string(static_cast<int32_t>(ValueNumber(*value)));
        std::memcpy(slot.data(), text.data(), std::min(text.size(), slot.size() - 1));
        break;
      }
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
      case FieldType::Float:
      case FieldType::Calculated: {
        std::string text = ValueString(*value);
        std::memcpy(slot.data(), text.data(), std::min(text.size(), slot.size() - 1));
        break;
      }
      case FieldType::Linked: {
        size_t block = std::min<size_t>(value->size(), kLinkedBlock);
        std::memcpy(slot.data(), value->data(), block);
        std::string text = ValueString(value->subspan(block));
        std::memcpy(slot.data() + kLinkedBlock, text.data(),
                    std::min(text.size(), slot.size() - kLinkedBlock - 1));
        break;
      }
      default:
        std::memcpy(slot.data(), value->data(), std::min(value->size(), slot.size()));
        break;
    }
  }
  return editing;
}

std::span<uint8_t> EditingSlot(Bytes& editing, int fieldSlot) {
  size_t off = EditingSlotOffset(editing, fieldSlot);
  size_t cap = GetLE16(editing.data() + off);
  return std::span<uint8_t>(editing.data() + off + 2, cap);
}

void PutFieldValue(int fieldSlot, ByteView value, Bytes& editing, const Schema& schema) {
  (void)schema;
  std::span<uint8_t> slot = EditingSlot(editing, fieldSlot);
  size_t n = std::min(value.size(), slot.size());
  std::memcpy(slot.data(), value.data(), n);
  std::memset(slot.data() + n, 0, slot.size() - n);
}

bool FieldEquals(int fieldSlot, ByteView value, ByteView editing, const Schema& schema) {
  (void)schema;
  size_t off = EditingSlotOffset(editing, fieldSlot);
  size_t cap = GetLE16(editing.data() + off);
  if (value.size() < cap) return false;
  return std::memcmp(editing.data() + off + 2, value.data(), cap) == 0;
}

void SetEditingText(Bytes& editing, int fieldSlot, const std::string& text, const Schema& schema) {
  std::span<uint8_t> slot = EditingSlot(editing, fieldSlot);
  // A Linked value's text follows its 24-byte block, which holds the linked
  // record's number and must survive a change of the text.
  const size_t start = schema.field[fieldSlot].type() == FieldType::Linked ? kLinkedBlock : 0;
  if (slot.size() <= start) return;
  std::span<uint8_t> room = slot.subspan(start);
  std::memset(room.data(), 0, room.size());
  std::memcpy(room.data(), text.data(), std::min(text.size(), room.size() - 1));
}

void SetEditingNumber(Bytes& editing, int fieldSlot, uint32_t value, const Schema& schema) {
  std::span<uint8_t> slot = EditingSlot(editing, fieldSlot);
  if (schema.field[fieldSlot].type() == FieldType::Integer) {
    SetEditingText(editing, fieldSlot, std::to_string(static_cast<int32_t>(value)), schema);
    return;
  }
  if (slot.size() >= 4) PutLE32(slot.data(), value);
}

void SetEditingByte(Bytes& editing, int fieldSlot, uint8_t value, const Schema& schema) {
  (void)schema;
  std::span<uint8_t> slot = EditingSlot(editing, fieldSlot);
  if (!slot.empty()) slot[0] = value;
}

int32_t ParseLong(std::string_view text) {
  size_t i = 0;
  while (i < text.size() && (text[i] == ' ' || (text[i] >= '\t' && text[i] <= '\r'))) ++i;
  bool negative = false;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
  int64_t value = 0;
  while (i < text.size() && text[i] >= '0' && text[i] <= '9') {
    value = value * 10 + (text[i++] - '0');
    if (value > int64_t(std::numeric_limits<int32_t>::max()) + 1) break;
  }
  if (negative) value = -value;
  value = std::clamp<int64_t>(value, std::numeric_limits<int32_t>::min(),
                              std::numeric_limits<int32_t>::max());
  return static_cast<int32_t>(value);
}

uint32_t ValueNumber(ByteView value) {
  uint8_t b[4] = {0, 0, 0, 0};
  std::memcpy(b, value.data(), std::min<size_t>(value.size(), 4));
  return GetLE32(b);
}

std::string ValueString(ByteView value) {
  return std::string(reinterpret_cast<const char*>(value.data()), TextLength(value.data(), value.size()));
}

}  // namespace cx
