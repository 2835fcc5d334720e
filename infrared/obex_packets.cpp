#include "infrared/obex_packets.h"

#include <algorithm>
#include <cstring>

#include "infrared/obex_format.h"

namespace cx::obex {

size_t BuildConnect(uint8_t* out) {
  out[0] = kConnect;
  PutU16(out + 1, 7);
  out[3] = kVersion;
  out[4] = 0;  // flags
  PutU16(out + 5, static_cast<uint16_t>(kPacketBufferSize));
  return 7;
}

size_t BuildPutFinal(uint8_t* out) {
  out[0] = kPutFinal;
  PutU16(out + 1, 6);
  out[3] = kHeaderEndOfBody;
  PutU16(out + 4, 3);
  return 6;
}

size_t BuildDisconnect(uint8_t* out) {
  out[0] = kDisconnect;
  PutU16(out + 1, 3);
  return 3;
}

size_t BuildBodyPart(uint8_t* out, const uint8_t* body, size_t count) {
  out[0] = kPut;
  PutU16(out + 1, static_cast<uint16_t>(count + 6));
  out[3] = kHeaderBody;
  PutU16(out + 4, static_cast<uint16_t>(count + 3));
  if (count > 0) std::memcpy(out + 6, body, count);
  return count + 6;
}

std::vector<uint8_t> BuildHeaderPut(const std::vector<HeaderItem>& items) {
  size_t length = kPacketPrefixSize;
  for (const HeaderItem& item : items) length += EncodedSize(item);
  std::vector<uint8_t> packet(length);
  packet[0] = kPut;
  PutU16(packet.data() + 1, static_cast<uint16_t>(length));
  size_t pos = kPacketPrefixSize;
  for (const HeaderItem& item : items) pos += EncodeHeader(item, packet.data() + pos);
  return packet;
}

std::vector<std::vector<HeaderItem>> GroupHeaders(const std::vector<HeaderItem>& items,
                                                  size_t limit) {
  std::vector<std::vector<HeaderItem>> groups(1);
  size_t length = kPacketPrefixSize;
  for (const HeaderItem& item : items) {
    size_t size = EncodedSize(item);
    if (size == 0) continue;
    if (length + size > limit && !groups.back().empty()) {
      groups.emplace_back();
      length = kPacketPrefixSize;
    }
    groups.back().push_back(item);
    length += size;
  }
  return groups;
}

std::vector<size_t> BodyPartSizes(uint16_t count, size_t peerLimit) {
  std::vector<size_t> parts;
  if (peerLimit == 0 || peerLimit >= kPacketBufferSize) {
    if (count <= kPacketBufferSize) return {count};
    // A first part of exactly one buffer, then parts of the same size until
    // fewer than 4067 bytes remain for the last.
    size_t remaining = count;
    while (remaining > 0) {
      size_t n = std::min(remaining, kBodyPartSize);
      parts.push_back(n);
      remaining -= n;
    }
    return parts;
  }
  size_t partSize = std::max(peerLimit, kMinimumPacketLength) - 6;
  size_t remaining = count;
  do {
    size_t n = std::min(remaining, partSize);
    parts.push_back(n);
    remaining -= n;
  } while (remaining > 0);
  return parts;
}

size_t AnnouncedPacketLimit(const std::vector<uint8_t>& connectReply) {
  if (connectReply.size() < 7) return 0;
  return GetU16(connectReply.data() + 5);
}

}  // namespace cx::obex
