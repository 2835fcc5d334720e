#include "engine/container.h"

#include <cstring>

#include "engine/byte_order.h"
#include "platform/file_io.h"

namespace cx {

std::string Header::Name() const {
  const void* nul = std::memchr(name.data(), 0, name.size());
  size_t len = nul ? static_cast<const uint8_t*>(nul) - name.data() : name.size();
  return std::string(reinterpret_cast<const char*>(name.data()), len);
}

void Header::SetName(const std::string& text) {
  name.fill(0);
  size_t n = text.size() < name.size() - 1 ? text.size() : name.size() - 1;
  std::memcpy(name.data(), text.data(), n);
}

Header InitHeader(const std::string& name) {
  Header h;
  h.SetName(name);
  h.attributes = format::kNewAttributes;
  h.version = 0;
  h.creationDate = format::kNewCreationDate;
  h.modificationDate = format::kNewModificationDate;
  h.lastBackupDate = 0;
  h.modificationNumber = format::kNewModificationNumber;
  h.appInfoID = format::kNewAppInfoID;
  h.sortInfoID = 0;
  h.type = format::kType;
  h.creator = format::kCreator;
  h.uniqueIDSeed = 0;
  h.nextRecordListID = 0;
  h.numRecords = 0;
  return h;
}

Header DecodeHeader(const uint8_t* p) {
  Header h;
  std::memcpy(h.name.data(), p, format::kNameSize);
  h.attributes = GetBE16(p + 32);
  h.version = GetBE16(p + 34);
  h.creationDate = GetBE32(p + 36);
  h.modificationDate = GetBE32(p + 40);
  h.lastBackupDate = GetBE32(p + 44);
  h.modificationNumber = GetBE32(p + 48);
  h.appInfoID = GetBE32(p + 52);
  h.sortInfoID = GetBE32(p + 56);
  h.type = GetBE32(p + 60);
  h.creator = GetBE32(p + 64);
  h.uniqueIDSeed = GetBE32(p + 68);
  h.nextRecordListID = GetBE32(p + 72);
  h.numRecords = GetBE16(p + 76);
  return h;
}

void EncodeHeader(const Header& h, uint8_t* p) {
  std::memcpy(p, h.name.data(), format::kNameSize);
  PutBE16(p + 32, h.attributes);
  PutBE16(p + 34, h.version);
  PutBE32(p + 36, h.creationDate);
  PutBE32(p + 40, h.modificationDate);
  PutBE32(p + 44, h.lastBackupDate);
  PutBE32(p + 48, h.modificationNumber);
  PutBE32(p + 52, h.appInfoID);
  PutBE32(p + 56, h.sortInfoID);
  PutBE32(p + 60, h.type);
  PutBE32(p + 64, h.creator);
  PutBE32(p + 68, h.uniqueIDSeed);
  PutBE32(p + 72, h.nextRecordListID);
  PutBE16(p + 76, h.numRecords);
}

RecordEntry DecodeEntry(const uint8_t* p) {
  RecordEntry e;
  e.offset = GetBE32(p);
  e.attributes = p[4];
  e.uniqueID = (uint32_t(p[5]) << 16) | (uint32_t(p[6]) << 8) | p[7];
  return e;
}

void EncodeEntry(const RecordEntry& e, uint8_t* p) {
  PutBE32(p, e.offset);
  p[4] = e.attributes;
  p[5] = uint8_t(e.uniqueID >> 16);
  p[6] = uint8_t(e.uniqueID >> 8);
  p[7] = uint8_t(e.uniqueID);
}

int ReadHeader(const std::string& path, Header& header) {
  uint8_t buf[format::kHeaderSize];
  int64_t n = ReadFileRange(path, 0, sizeof buf, buf);
  if (n < 0) return 0;
  if (n < static_cast<int64_t>(sizeof buf)) return -1;
  header = DecodeHeader(buf);
  return header.creator == format::kCreator ? 1 : -1;
}

bool IsDatabaseFile(const std::string& path, Header* header) {
  Header h;
  int r = ReadHeader(path, h);
  if (header) *header = h;
  return r == 1;
}

std::string FourCCText(uint32_t code) {
  std::string s;
  for (int shift = 24; shift >= 0; shift -= 8) {
    char c = static_cast<char>((code >> shift) & 0xFF);
    s.push_back(c >= 32 && c < 127 ? c : '?');
  }
  return s;
}

}  // namespace cx
