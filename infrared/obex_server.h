// The receiving side's protocol: answers one peer's CONNECT, PUT and
// DISCONNECT packets and hands every complete object to a sink. What
// becomes of an object (stored, inserted, refused) is the sink's business.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/transport.h"

namespace cx::obex {

// An object as it arrived. Texts are UTF-8 and exactly as sent: nothing
// here has checked a name for path separators.
struct ReceivedObject {
  std::string name;
  std::string description;
  std::string type;     // the Type header, if any
  std::string creator;  // the Creator id's 4 bytes, if sent
  bool hasLength = false;
  uint32_t length = 0;
  std::vector<uint8_t> body;
};

class ObjectSink {
 public:
  virtual ~ObjectSink() = default;
  // One complete object. Returns the response to its final PUT: kSuccess
  // when it was taken, an error response when it was refused.
  virtual uint8_t Deliver(ReceivedObject& object) = 0;
};

struct ServerOptions {
  // The longest wait for any one packet.
  int packetTimeoutMs = 30000;
  // Bodies beyond this are refused (Request Entity Too Large).
  size_t maxObjectSize = size_t{32} << 20;
  // The longest a response may take to go out: a peer that stops reading
  // must not hold the session (and its thread) for ever.
  int sendTimeoutMs = 10000;
  // The longest a whole session may last, however busy the peer keeps it.
  int sessionTimeoutMs = 10 * 60 * 1000;
  // When set, the session ends at once (between packets or while waiting).
  const std::atomic<bool>* stop = nullptr;
};

enum class SessionEnd {
  kDisconnected,  // the peer said goodbye
  kPeerClosed,    // the stream ended without DISCONNECT
  kFailed,        // a receive or a send failed, or a packet or the session took too long
  kMalformed,     // a packet length made the stream unreadable
  kStopped,       // the stop flag was set
};

struct SessionSummary {
  SessionEnd end = SessionEnd::kDisconnected;
  int delivered = 0;  // objects handed to the sink
  int accepted = 0;   // of those, the ones the sink answered with success
};

// Serves one connection until it ends. An object not yet complete when the
// session ends is dropped without reaching the sink.
SessionSummary ServeObexSession(StreamConnection& connection, ObjectSink& sink,
                                const ServerOptions& options);

}  // namespace cx::obex
