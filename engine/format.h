// Constants of the database file format, shared by reader and writer.
// docs/file-format.md describes the layout these numbers come from.
#pragma once

#include <cstddef>
#include <cstdint>

namespace cx::format {

// Container (all big-endian).
constexpr size_t kHeaderSize = 78;        // name 32 + 2+2 + 4*9 + 2
constexpr size_t kNameSize = 32;
constexpr size_t kEntrySize = 8;          // u32 offset, u8 attributes, 3-byte unique id
constexpr size_t kListOffset = kHeaderSize;
constexpr size_t kGapSize = 2;            // two zero bytes after the entry list
constexpr size_t kAppInfoSize = 40;       // zero block, never interpreted
constexpr uint8_t kDirtyBit = 0x40;       // on record 0's entry: unsaved changes

constexpr uint32_t FourCC(char a, char b, char c, char d) {
  return (uint32_t(uint8_t(a)) << 24) | (uint32_t(uint8_t(b)) << 16) |
         (uint32_t(uint8_t(c)) << 8) | uint32_t(uint8_t(d));
}
constexpr uint32_t kCreator = FourCC('Q', 'r', 'T', 'a');
constexpr uint32_t kType = FourCC('Q', 'r', 'T', 'a');

// Header values of a new database.
constexpr uint16_t kNewAttributes = 8;  // backup bit
constexpr uint32_t kNewCreationDate = 893970430;
constexpr uint32_t kNewModificationDate = 893970435;
constexpr uint32_t kNewModificationNumber = 86;
constexpr uint32_t kNewAppInfoID = 416;

// Record layout of the file.
constexpr int kFieldCount = 30;
constexpr int kPopupRecords = 30;
constexpr int kFirstDataRecord = 1 + kPopupRecords;  // 31
constexpr int kMaxFileRecords = 65535;
constexpr int kMaxDataRecords = kMaxFileRecords - kFirstDataRecord;  // 65504
// Records are read into a buffer of this many bytes; a record must be
// smaller. The last record of a file is cut to it.
constexpr size_t kMaxRecordSize = 65535;

// Schema record.
constexpr size_t kSchemaSize = 2152;
constexpr size_t kSchemaVersion1Size = 2038;  // ends after fieldFlagsB
constexpr uint8_t kSchemaVersion = 2;
constexpr size_t kFilterSize = 92;
constexpr size_t kFieldDefSize = 56;

// Popup lists.
constexpr int kMaxPopupItems = 60;
constexpr size_t kMaxPopupText = 79;
constexpr uint8_t kNoPopupValue = 255;

// Data records.
constexpr size_t kExtensionSize = 20;
constexpr uint16_t kEndMark = 0xFFFF;

// Dates: day 0 is 1 January 1904 and means "no date".
constexpr int kBaseYear = 1904;
constexpr uint8_t kNoTimeHours = 255;

}  // namespace cx::format
