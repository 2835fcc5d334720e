// Reading whole OBEX packets off a stream: the 3-byte prefix first, then
// as many bytes as its length announces, all within one time limit.
#pragma once

#include <atomic>
#include <cstdint>
#include <vector>

#include "platform/transport.h"

namespace cx::obex {

enum class ReadResult {
  kPacket,     // `packet` holds one whole packet
  kClosed,     // the peer closed before or inside the packet
  kFailed,     // a receive failed or the time ran out (`error`)
  kBadLength,  // the announced length is below 3: the stream cannot be trusted
};

// Reads one packet within `timeoutMs`. Partial packets are left in
// `packet` so that a caller can still look at the first byte. A `stop` flag
// that gets set ends the wait early (kFailed, ECANCELED).
ReadResult ReadPacket(StreamConnection& connection, std::vector<uint8_t>& packet, int timeoutMs,
                      int& error, const std::atomic<bool>* stop = nullptr);

// Sends the whole packet; false (with `error`) if any of it did not go.
bool SendPacket(StreamConnection& connection, const uint8_t* data, size_t size, int& error);
bool SendPacket(StreamConnection& connection, const std::vector<uint8_t>& packet, int& error);

}  // namespace cx::obex
