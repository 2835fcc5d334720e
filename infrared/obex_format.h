// Constants of the OBEX exchange, shared by the sender and the receiver.
// Every packet starts with an opcode (or response code) byte and a 16-bit
// big-endian length counting the whole packet.
#pragma once

#include <cstddef>
#include <cstdint>

namespace cx::obex {

// Packet buffer of a transfer; also the maximum packet length we announce.
constexpr size_t kPacketBufferSize = 4072;
// The buffer is committed a whole page at a time, which is why a body of up
// to kPacketBufferSize bytes still fits in one PUT of length n + 6.
constexpr size_t kPacketBufferAllocation = 4096;
// Body bytes carried by each full part when a body is split.
constexpr size_t kBodyPartSize = kPacketBufferSize - 6;
// The smallest maximum packet length OBEX lets a peer announce.
constexpr size_t kMinimumPacketLength = 255;
constexpr size_t kPacketPrefixSize = 3;  // opcode, 16-bit length
// Replies are looked at only this far.
constexpr size_t kReplyInspectSize = 100;

constexpr uint8_t kVersion = 0x10;

// Requests (the 0x80 bit marks the final packet of a request).
constexpr uint8_t kConnect = 0x80;
constexpr uint8_t kDisconnect = 0x81;
constexpr uint8_t kPut = 0x02;
constexpr uint8_t kPutFinal = 0x82;
constexpr uint8_t kGet = 0x03;
constexpr uint8_t kGetFinal = 0x83;
constexpr uint8_t kSetPath = 0x85;
constexpr uint8_t kAbort = 0xFF;
constexpr uint8_t kFinalBit = 0x80;

// Responses.
constexpr uint8_t kContinue = 0x90;
constexpr uint8_t kSuccess = 0xA0;
constexpr uint8_t kBadRequest = 0xC0;
constexpr uint8_t kForbidden = 0xC3;
constexpr uint8_t kNotFound = 0xC4;
constexpr uint8_t kRequestTimeout = 0xC8;
constexpr uint8_t kConflict = 0xC9;
constexpr uint8_t kLengthRequired = 0xCB;
constexpr uint8_t kEntityTooLarge = 0xCD;
constexpr uint8_t kUnsupportedType = 0xCF;
constexpr uint8_t kInternalError = 0xD0;
constexpr uint8_t kNotImplemented = 0xD1;

// Header ids. The top two bits give the encoding: 00 UTF-16 text and 01
// bytes (both with a 16-bit length counting the id and itself), 10 one
// byte, 11 four bytes.
constexpr uint8_t kHeaderName = 0x01;
constexpr uint8_t kHeaderDescription = 0x05;
constexpr uint8_t kHeaderType = 0x42;
constexpr uint8_t kHeaderTarget = 0x46;
constexpr uint8_t kHeaderBody = 0x48;
constexpr uint8_t kHeaderEndOfBody = 0x49;
constexpr uint8_t kHeaderWho = 0x4A;
constexpr uint8_t kHeaderLength = 0xC3;
constexpr uint8_t kHeaderConnectionId = 0xCB;
constexpr uint8_t kHeaderCreatorId = 0xCF;

constexpr uint8_t kEncodingMask = 0xC0;
constexpr uint8_t kEncodingUnicode = 0x00;
constexpr uint8_t kEncodingBytes = 0x40;
constexpr uint8_t kEncodingByte = 0x80;
constexpr uint8_t kEncodingQuad = 0xC0;

// The creator code that makes the receiving side install a whole database.
constexpr char kDatabaseCreator[] = "lnch";
// The creator code of our record payloads.
constexpr char kRecordCreator[] = "QrTa";

inline void PutU16(uint8_t* p, uint16_t v) {
  p[0] = static_cast<uint8_t>(v >> 8);
  p[1] = static_cast<uint8_t>(v);
}
inline uint16_t GetU16(const uint8_t* p) { return static_cast<uint16_t>(p[0] << 8 | p[1]); }
inline uint32_t GetU32(const uint8_t* p) {
  return uint32_t{p[0]} << 24 | uint32_t{p[1]} << 16 | uint32_t{p[2]} << 8 | p[3];
}

}  // namespace cx::obex
