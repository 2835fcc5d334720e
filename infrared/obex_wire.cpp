#include "infrared/obex_wire.h"

#include <cerrno>
#include <algorithm>
#include <chrono>

#include "infrared/obex_format.h"

namespace cx::obex {
namespace {

using Clock = std::chrono::steady_clock;

// How often a wait looks at the stop flag.
constexpr long kStopSliceMs = 100;

// Reads until `packet` holds `want` bytes or the deadline passes.
ReadResult Fill(StreamConnection& connection, std::vector<uint8_t>& packet, size_t want,
                Clock::time_point deadline, const std::atomic<bool>* stop, int& error) {
  while (packet.size() < want) {
    if (stop && *stop) {
      error = ECANCELED;
      return ReadResult::kFailed;
    }
    auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
    if (left.count() <= 0) {
      error = ETIMEDOUT;
      return ReadResult::kFailed;
    }
    long waitMs = stop ? std::min<long>(left.count(), kStopSliceMs) : left.count();
    size_t have = packet.size();
    packet.resize(want);
    long n = connection.Receive(packet.data() + have, want - have, static_cast<int>(waitMs));
    if (n < 0 && connection.error() == ETIMEDOUT && Clock::now() < deadline) {
      packet.resize(have);
      continue;
    }
    packet.resize(have + (n > 0 ? static_cast<size_t>(n) : 0));
    if (n == 0) {
      error = ECONNRESET;
      return ReadResult::kClosed;
    }
    if (n < 0) {
      error = connection.error();
      return ReadResult::kFailed;
    }
  }
  return ReadResult::kPacket;
}

}  // namespace

ReadResult ReadPacket(StreamConnection& connection, std::vector<uint8_t>& packet, int timeoutMs,
                      int& error, const std::atomic<bool>* stop) {
  packet.clear();
  error = 0;
  auto deadline = Clock::now() + std::chrono::milliseconds(timeoutMs);
  ReadResult r = Fill(connection, packet, kPacketPrefixSize, deadline, stop, error);
  if (r != ReadResult::kPacket) return r;
  size_t length = GetU16(packet.data() + 1);
  if (length < kPacketPrefixSize) return ReadResult::kBadLength;
  return Fill(connection, packet, length, deadline, stop, error);
}

bool SendPacket(StreamConnection& connection, const uint8_t* data, size_t size, int& error) {
  long sent = connection.Send(data, size);
  if (sent == static_cast<long>(size)) return true;
  error = connection.error();
  if (error == 0) error = EPIPE;
  return false;
}

bool SendPacket(StreamConnection& connection, const std::vector<uint8_t>& packet, int& error) {
  return SendPacket(connection, packet.data(), packet.size(), error);
}

}  // namespace cx::obex
