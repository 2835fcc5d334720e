// The sending side of a beam: find the peer, connect, and push one object
// through CONNECT, header PUT, body PUTs, PUT final and DISCONNECT.
//
// Nothing a peer answers stops a transfer: every reply is checked and an
// unexpected one is reported, but the next packet always follows. Peers
// answer oddly and the object usually arrives anyway.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "infrared/obex_headers.h"
#include "platform/transport.h"
#include "platform/ui_port.h"

namespace cx::obex {

// The two windows the user-interface thread keeps open during a transfer.
// Called from the sending thread; an implementation forwards to its UI.
class BeamWindows {
 public:
  virtual ~BeamWindows() = default;
  virtual void ShowDeviceSearch() {}
  virtual void CloseDeviceSearch() {}
  virtual void ShowProgress() {}
  virtual void Progress(size_t /*bodySent*/, size_t /*bodyTotal*/) {}
  virtual void CloseProgress() {}
};

// Everything one transfer works with.
struct ObexLink {
  StreamTransport& transport;
  UiPort& ui;  // messages are shown from the sending thread
  BeamWindows& windows;
  // Set by the device-search window's cancel button; read between polls.
  const std::atomic<bool>& cancel;
  // Set when the user-interface thread has stopped waiting: the transfer
  // then ends at the next packet without showing anything more.
  const std::atomic<bool>& abandoned;
  int replyTimeoutMs = 30000;
  int pollIntervalMs = 100;
};

// Searches for a device until one is found and connects to the first.
// Nothing when the search was cancelled (no message) or failed (after the
// message naming InitIrSock). A connection aborted by the peer sends the
// search round again.
std::unique_ptr<StreamConnection> InitIrSock(ObexLink& link);

// Sends `length` bytes and compares the first byte of the reply with
// `expected`. Failures are shown, never acted upon; 1 when the reply
// matched, 0 otherwise. `reply`, when given, receives the reply's first
// bytes.
int SendObexPacket(size_t length, const uint8_t* buffer, StreamConnection& socket,
                   uint8_t expected, ObexLink& link, std::vector<uint8_t>* reply = nullptr);

// One whole transfer of the object described by `items` (see ObjectItems).
// 1 when it ran to its end, whatever the replies were; 0 when the packet
// buffer could not be had or no connection was made.
int PutObexInfo(const std::vector<HeaderItem>& items, ObexLink& link);

}  // namespace cx::obex
