// The packets the sender writes, byte for byte, and the rules that decide
// how headers and body are spread over PUT packets.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "infrared/obex_headers.h"

namespace cx::obex {

// Each writes the packet at `out` and returns its length.
size_t BuildConnect(uint8_t* out);     // announces kPacketBufferSize
size_t BuildPutFinal(uint8_t* out);    // PUT final with an empty End of Body
size_t BuildDisconnect(uint8_t* out);
// A PUT carrying `count` body bytes in one Body header: length count + 6.
size_t BuildBodyPart(uint8_t* out, const uint8_t* body, size_t count);

// The header PUT for the given items (Body items are skipped).
std::vector<uint8_t> BuildHeaderPut(const std::vector<HeaderItem>& items);

// Spreads the header items over PUTs of at most `limit` bytes, keeping
// their order; all in one PUT whenever they fit. An item too large for any
// PUT travels alone.
std::vector<std::vector<HeaderItem>> GroupHeaders(const std::vector<HeaderItem>& items,
                                                  size_t limit);

// Byte counts of the body parts. With `peerLimit` 0 (or kPacketBufferSize
// and above) the handheld's rule: a body of up to 4072 bytes in one part,
// a larger one in parts of 4066 with a shorter last part. Below that, parts
// of peerLimit - 6 bytes so that no packet exceeds what the peer accepts.
std::vector<size_t> BodyPartSizes(uint16_t count, size_t peerLimit);

// The maximum packet length a CONNECT response announces, or 0 when the
// reply is too short to say.
size_t AnnouncedPacketLimit(const std::vector<uint8_t>& connectReply);

}  // namespace cx::obex
