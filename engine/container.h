// The file container: the 78-byte header and the list of record entries.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "engine/format.h"

namespace cx {

struct Header {
  std::array<uint8_t, format::kNameSize> name{};  // raw, NUL-terminated
  uint16_t attributes = 0;
  uint16_t version = 0;
  uint32_t creationDate = 0;
  uint32_t modificationDate = 0;
  uint32_t lastBackupDate = 0;
  uint32_t modificationNumber = 0;
  uint32_t appInfoID = 0;
  uint32_t sortInfoID = 0;
  uint32_t type = 0;
  uint32_t creator = 0;
  uint32_t uniqueIDSeed = 0;
  uint32_t nextRecordListID = 0;
  uint16_t numRecords = 0;

  std::string Name() const;  // up to the first NUL
  void SetName(const std::string& text);  // at most 31 bytes, zero padded
  bool operator==(const Header&) const = default;
};

struct RecordEntry {
  uint32_t offset = 0;
  uint8_t attributes = 0;
  uint32_t uniqueID = 0;  // 24 bits
};

// Header of a new database named `name`; numRecords 0.
Header InitHeader(const std::string& name);

// Decodes 78 bytes (the caller guarantees them).
Header DecodeHeader(const uint8_t* bytes);
void EncodeHeader(const Header& header, uint8_t* out);  // writes 78 bytes

RecordEntry DecodeEntry(const uint8_t* bytes);
void EncodeEntry(const RecordEntry& entry, uint8_t* out);  // writes 8 bytes

// Reads the header of a file: 0 when the file cannot be opened, 1 when the
// creator is ours, -1 otherwise (a file too short to hold a header too). The
// header is filled in whenever 78 bytes could be read.
int ReadHeader(const std::string& path, Header& header);

// True when `path` is a database of this program (ReadHeader gives 1).
bool IsDatabaseFile(const std::string& path, Header* header = nullptr);

// "QrTa" and the like for display; unprintable bytes shown as '?'.
std::string FourCCText(uint32_t code);

}  // namespace cx
