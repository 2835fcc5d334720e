#include "tests/infrared/scripted_peer.h"

#include "infrared/obex_format.h"
#include "infrared/obex_wire.h"

namespace cx::testing {

uint8_t ExpectedAnswer(const std::vector<uint8_t>& packet) {
  return packet[0] == obex::kPut ? obex::kContinue : obex::kSuccess;
}

ScriptedPeer::ScriptedPeer(std::unique_ptr<StreamListener> listener, uint16_t maxPacket,
                           Answer answer)
    : listener_(std::move(listener)), maxPacket_(maxPacket), answer_(std::move(answer)) {
  if (!answer_) answer_ = [](const std::vector<uint8_t>& p, size_t) { return ExpectedAnswer(p); };
  thread_ = std::thread([this] { Run(); });
}

ScriptedPeer::~ScriptedPeer() {
  if (thread_.joinable()) thread_.join();
}

const std::vector<std::vector<uint8_t>>& ScriptedPeer::Packets() {
  if (thread_.joinable()) thread_.join();
  return packets_;
}

std::vector<size_t> ScriptedPeer::Lengths() {
  std::vector<size_t> lengths;
  for (const auto& p : Packets()) lengths.push_back(p.size());
  return lengths;
}

void ScriptedPeer::Run() {
  int error = 0;
  auto connection = listener_->Accept(10000, error);
  if (!connection) return;
  std::vector<uint8_t> packet;
  // Bounded: a session of the tests never holds this many packets.
  for (int i = 0; i < 1000; ++i) {
    if (obex::ReadPacket(*connection, packet, 5000, error) != obex::ReadResult::kPacket) return;
    packets_.push_back(packet);
    if (hangUpAfter_ != 0 && packets_.size() == hangUpAfter_) {
      connection->Close();
      return;
    }
    std::vector<uint8_t> reply = {answer_(packet, packets_.size() - 1), 0, 3};
    if (packet[0] == obex::kConnect) {
      reply = {reply[0], 0, 7, obex::kVersion, 0, 0, 0};
      obex::PutU16(reply.data() + 5, maxPacket_);
    }
    obex::SendPacket(*connection, reply, error);
    if (packet[0] == obex::kDisconnect) return;
  }
}

}  // namespace cx::testing
