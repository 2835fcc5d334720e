// A peer for the sender's tests: accepts one connection, records every
// packet and answers each with a code chosen by the test.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <thread>
#include <vector>

#include "infrared/obex_format.h"
#include "infrared/obex_server.h"
#include "platform/transport.h"

namespace cx::testing {

class ScriptedPeer {
 public:
  // Answers: CONNECT gets 0xA0 announcing `maxPacket`; everything else the
  // code `answer` returns for it (by default the codes OBEX expects).
  using Answer = std::function<uint8_t(const std::vector<uint8_t>& packet, size_t index)>;

  ScriptedPeer(std::unique_ptr<StreamListener> listener, uint16_t maxPacket = 4072,
               Answer answer = nullptr);
  ~ScriptedPeer();

  // Waits (bounded) for the session to end, then returns what arrived.
  const std::vector<std::vector<uint8_t>>& Packets();
  std::vector<size_t> Lengths();

  // Close the connection after this many packets (0: never).
  void HangUpAfter(size_t count) { hangUpAfter_ = count; }

 private:
  void Run();

  std::unique_ptr<StreamListener> listener_;
  uint16_t maxPacket_;
  Answer answer_;
  size_t hangUpAfter_ = 0;
  std::vector<std::vector<uint8_t>> packets_;
  std::thread thread_;
};

// Keeps every object the receiver completes and answers with `answer`.
class RecordingSink : public obex::ObjectSink {
 public:
  uint8_t Deliver(obex::ReceivedObject& object) override {
    objects.push_back(object);
    return answer;
  }
  std::vector<obex::ReceivedObject> objects;
  uint8_t answer = obex::kSuccess;
};

// The code OBEX expects for a request: 0x90 for a non-final PUT, else 0xA0.
uint8_t ExpectedAnswer(const std::vector<uint8_t>& packet);

}  // namespace cx::testing
