// Data records: the stored (compact) form kept in files and the editing
// (full-capacity) form the record editor writes into. Both begin with a
// prefix byte (and 20 more bytes when it is nonzero), then one slot per
// field: a 16-bit little-endian length and that many value bytes. The
// length 0xFFFF ends a stored record early.
#pragma once

#include <cstdint>
#include <array>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "engine/schema.h"

namespace cx {

using Bytes = std::vector<uint8_t>;
using ByteView = std::span<const uint8_t>;

// Offset of the first slot: 21 when the record's own prefix flag is
// nonzero, 1 otherwise.
size_t DataStart(ByteView record);

// FieldOffset: the offset of the slot's value bytes, or -1 when the record
// ends (end mark or its size) before the slot.
int FieldOffset(int fieldSlot, ByteView record);
// FieldLength: the slot's stored length, or 0 when the record ends first.
int FieldLength(ByteView record, int fieldSlot);
// The slot's value bytes, cut at the end of the record; nothing when the
// record does not contain the slot.
std::optional<ByteView> FieldValue(ByteView record, int fieldSlot);
// Every slot's value in one walk over the record (what FieldValue gives
// for each slot), for code that looks at many fields of one record.
std::array<std::optional<ByteView>, format::kFieldCount> FieldValues(ByteView record);
// False when a slot's length runs past the end of the record.
bool RecordIsWellFormed(ByteView record);

// Capacity of a slot in the editing form.
int EditingCapacity(const FieldDef& field);
// EditingSize: prefix plus every slot's capacity and length bytes.
size_t EditingSize(const Schema& schema);
// NewEditingRecord: an editing record with every value zero.
Bytes NewEditingRecord(const Schema& schema);
// StoredSize: the size Compact will produce for an editing record.
size_t StoredSize(ByteView editing, const Schema& schema);
// Compact: the stored form of an editing record.
Bytes Compact(ByteView editing, const Schema& schema);
// The editing form of a stored record (values cut to their capacity;
// missing slots zero). Integers become their decimal text.
Bytes Expand(ByteView stored, const Schema& schema);

// PutFieldValue: copies a slot's capacity bytes from `value` (shorter
// values are zero-filled). FieldEquals compares them.
void PutFieldValue(int fieldSlot, ByteView value, Bytes& editing, const Schema& schema);
bool FieldEquals(int fieldSlot, ByteView value, ByteView editing, const Schema& schema);

// Writable view of a slot in an editing record (its capacity bytes).
std::span<uint8_t> EditingSlot(Bytes& editing, int fieldSlot);

// Conveniences over the editing form for the value kinds. Texts are cut to
// the slot's capacity less its NUL.
void SetEditingText(Bytes& editing, int fieldSlot, const std::string& text, const Schema& schema);
void SetEditingNumber(Bytes& editing, int fieldSlot, uint32_t value, const Schema& schema);
void SetEditingByte(Bytes& editing, int fieldSlot, uint8_t value, const Schema& schema);

// Decimal text to 32-bit number as the C library's long conversion reads
// it: leading blanks, optional sign, digits; stops at anything else; no
// digits gives 0. Out-of-range values clamp.
int32_t ParseLong(std::string_view text);

// The 32-bit number at the start of a value (little-endian); missing bytes
// read as zero.
uint32_t ValueNumber(ByteView value);
// The text at the start of a value, up to its NUL or the end of the value.
std::string ValueString(ByteView value);

}  // namespace cx
