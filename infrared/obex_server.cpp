#include "infrared/obex_server.h"

#include <algorithm>
#include <cerrno>
#include <chrono>

#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"
#include "infrared/object_assembler.h"
#include "infrared/obex_wire.h"

namespace cx::obex {
namespace {

using Clock = std::chrono::steady_clock;

// False when the response did not go out (in time): the session is over.
bool Respond(StreamConnection& connection, uint8_t code) {
  uint8_t packet[3] = {code, 0, 3};
  int error = 0;
  return SendPacket(connection, packet, sizeof packet, error);
}

// CONNECT: version, flags and the peer's maximum packet length, then any
// headers (Target, Who, Count...). None of them changes the answer.
bool AnswerConnect(StreamConnection& connection, const std::vector<uint8_t>& packet) {
  if (packet.size() < 7) return Respond(connection, kBadRequest);
  HeaderReader reader(packet.data() + 7, packet.size() - 7);
  Header h;
  while (reader.Next(h)) {
  }
  if (reader.malformed()) return Respond(connection, kBadRequest);
  uint8_t reply[7] = {kSuccess, 0, 7, kVersion, 0, 0, 0};
  PutU16(reply + 5, static_cast<uint16_t>(kPacketBufferSize));
  int error = 0;
  return SendPacket(connection, reply, sizeof reply, error);
}

}  // namespace

SessionSummary ServeObexSession(StreamConnection& connection, ObjectSink& sink,
                                const ServerOptions& options) {
  SessionSummary summary;
  ObjectAssembler assembler(options.maxObjectSize);
  std::vector<uint8_t> packet;
  connection.SetSendTimeout(options.sendTimeoutMs);
  const auto sessionEnd = Clock::now() + std::chrono::milliseconds(options.sessionTimeoutMs);
  bool sent = true;
  for (;;) {
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(sessionEnd - Clock::now()).count();
    if (!sent || left <= 0) {
      summary.end = SessionEnd::kFailed;
      return summary;
    }
    const int timeoutMs = static_cast<int>(std::min<long long>(left, options.packetTimeoutMs));
    int error = 0;
    switch (ReadPacket(connection, packet, timeoutMs, error, options.stop)) {
      case ReadResult::kPacket:
        break;
      case ReadResult::kClosed:
        summary.end = SessionEnd::kPeerClosed;
        return summary;
      case ReadResult::kFailed:
        summary.end = error == ECANCELED ? SessionEnd::kStopped : SessionEnd::kFailed;
        return summary;
      case ReadResult::kBadLength:
        Respond(connection, kBadRequest);
        summary.end = SessionEnd::kMalformed;
        return summary;
    }
    const uint8_t opcode = packet[0];
    const uint8_t* headers = packet.data() + kPacketPrefixSize;
    const size_t headerBytes = packet.size() - kPacketPrefixSize;
    switch (opcode) {
      case kConnect:
        sent = AnswerConnect(connection, packet);
        break;
      case kDisconnect:
        Respond(connection, kSuccess);
        summary.end = SessionEnd::kDisconnected;
        return summary;
      case kPut:
        sent = Respond(connection, assembler.Apply(headers, headerBytes));
        break;
      case kPutFinal: {
        uint8_t code = assembler.Apply(headers, headerBytes);
        if (code == kContinue) code = assembler.Finish();
        if (code == kSuccess) {
          ++summary.delivered;
          code = sink.Deliver(assembler.object());
          if (code == kSuccess) ++summary.accepted;
        }
        assembler.Reset();
        sent = Respond(connection, code);
        break;
      }
      case kAbort:
        assembler.Reset();
        sent = Respond(connection, kSuccess);
        break;
      default:
        sent = Respond(connection, kNotImplemented);
        break;
    }
  }
}

}  // namespace cx::obex
