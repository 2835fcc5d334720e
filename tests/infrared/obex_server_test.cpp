// The receiver's protocol side, driven packet by packet as existing
// clients and hostile peers drive it.
#include <gtest/gtest.h>

#include <thread>

#include "infrared/beam_transfer.h"
#include "infrared/memory_transport.h"
#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"
#include "infrared/obex_server.h"
#include "infrared/obex_text.h"
#include "infrared/obex_wire.h"
#include "tests/infrared/scripted_peer.h"
#include "tests/support/test_support.h"

namespace cx::obex {
namespace {

using Bytes = std::vector<uint8_t>;

using cx::testing::RecordingSink;

Bytes Packet(uint8_t opcode, const Bytes& headers) {
  Bytes p = {opcode, 0, 0};
  p.insert(p.end(), headers.begin(), headers.end());
  PutU16(p.data() + 1, static_cast<uint16_t>(p.size()));
  return p;
}

Bytes Text(uint8_t id, const std::string& text) {
  Bytes units = Utf8ToUtf16Be(text);
  Bytes h(3 + units.size() + 2, 0);  // id, length, the units, a 16-bit zero
  h[0] = id;
  PutU16(h.data() + 1, static_cast<uint16_t>(h.size()));
  std::copy(units.begin(), units.end(), h.begin() + 3);
  return h;
}

Bytes Body(uint8_t id, const Bytes& data) {
  Bytes h = {id, 0, 0};
  h.insert(h.end(), data.begin(), data.end());
  PutU16(h.data() + 1, static_cast<uint16_t>(h.size()));
  return h;
}

Bytes Length(uint32_t n) {
  return {kHeaderLength, uint8_t(n >> 24), uint8_t(n >> 16), uint8_t(n >> 8), uint8_t(n)};
}

Bytes Join(std::initializer_list<Bytes> parts) {
  Bytes all;
  for (const Bytes& p : parts) all.insert(all.end(), p.begin(), p.end());
  return all;
}

const Bytes kConnectPacket = {0x80, 0x00, 0x07, 0x10, 0x00, 0x04, 0x00};

class Receiver : public ::testing::Test {
 protected:
  void SetUp() override {
    int error = 0;
    listener_ = transport_.Listen("rx", error);
    client_ = transport_.Connect("rx", error);
    server_ = std::thread([this] {
      int e = 0;
      auto connection = listener_->Accept(5000, e);
      if (connection) summary_ = ServeObexSession(*connection, sink_, options_);
    });
  }
  void TearDown() override { Finish(); }
  void Finish() {
    if (server_.joinable()) {
      client_->Close();
      server_.join();
    }
  }
  // Sends a packet and returns the first byte of the answer (0 if none).
  uint8_t Ask(const Bytes& packet) {
    int error = 0;
    SendPacket(*client_, packet, error);
    return Reply();
  }
  uint8_t Reply() {
    int error = 0;
    if (ReadPacket(*client_, reply_, 5000, error) != ReadResult::kPacket) return 0;
    return reply_[0];
  }

  ServerOptions options_{1000, 100000};
  MemoryTransport transport_;
  std::unique_ptr<StreamListener> listener_;
  std::unique_ptr<StreamConnection> client_;
  RecordingSink sink_;
  SessionSummary summary_;
  Bytes reply_;
  std::thread server_;
};

TEST_F(Receiver, AnswersTheSendersSequence) {
  EXPECT_EQ(Ask(kConnectPacket), kSuccess);
  EXPECT_EQ(reply_, (Bytes{0xA0, 0x00, 0x07, 0x10, 0x00, 0x0F, 0xE8}));
  EXPECT_EQ(Ask(Packet(kPut, Join({Text(kHeaderDescription, "Contacts.PDB"),
                                   Text(kHeaderName, "Contacts.cxr"),
                                   Bytes{0xCF, 'Q', 'r', 'T', 'a'}, Length(4)}))),
            kContinue);
  EXPECT_EQ(Ask(Packet(kPut, Body(kHeaderBody, {1, 2}))), kContinue);
  EXPECT_EQ(Ask(Packet(kPut, Body(kHeaderBody, {3, 4}))), kContinue);
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderEndOfBody, {}))), kSuccess);
  EXPECT_EQ(Ask(Packet(kDisconnect, {})), kSuccess);
  Finish();
  EXPECT_EQ(summary_.end, SessionEnd::kDisconnected);
  ASSERT_EQ(sink_.objects.size(), 1u);
  const ReceivedObject& o = sink_.objects[0];
  EXPECT_EQ(o.name, "Contacts.cxr");
  EXPECT_EQ(o.description, "Contacts.PDB");
  EXPECT_EQ(o.creator, "QrTa");
  EXPECT_EQ(o.body, (Bytes{1, 2, 3, 4}));
}

TEST_F(Receiver, AcceptsWhatOtherClientsSend) {
  // Target and Who in CONNECT; Name, Length and the first Body together;
  // an empty End-of-Body.
  EXPECT_EQ(Ask(Packet(kConnect, Join({{0x10, 0x00, 0x04, 0x00},
                                       Body(kHeaderTarget, Bytes(16, 0xAB)),
                                       Body(kHeaderWho, {1, 2, 3})}))),
            kSuccess);
  EXPECT_EQ(Ask(Packet(kPut, Join({Text(kHeaderName, "a.PDB"), Length(3),
                                   Body(kHeaderBody, {7, 8})}))),
            kContinue);
  EXPECT_EQ(Ask(Packet(kPut, Body(kHeaderBody, {9}))), kContinue);
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderEndOfBody, {}))), kSuccess);
  // A final PUT that carries Body instead of End-of-Body, no CONNECT first
  // needed for a second object.
  EXPECT_EQ(Ask(Packet(kPut, Join({Text(kHeaderName, "b.PDB"), Length(2)}))), kContinue);
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderBody, {5, 6}))), kSuccess);
  EXPECT_EQ(Ask(Packet(kDisconnect, {})), kSuccess);
  Finish();
  ASSERT_EQ(sink_.objects.size(), 2u);
  EXPECT_EQ(sink_.objects[0].body, (Bytes{7, 8, 9}));
  EXPECT_EQ(sink_.objects[1].name, "b.PDB");
  EXPECT_EQ(sink_.objects[1].body, (Bytes{5, 6}));
}

TEST_F(Receiver, RefusesObjectsThatDoNotAddUp) {
  // A header running past its packet.
  Bytes bad = Packet(kPut, Join({Text(kHeaderName, "x"), Bytes{0x48, 0x00, 0x40, 1}}));
  EXPECT_EQ(Ask(bad), kBadRequest);
  EXPECT_EQ(Ask(Packet(kPut, Body(kHeaderBody, {1}))), kBadRequest);  // still refused
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderEndOfBody, {}))), kBadRequest);
  // A body over the announced length.
  EXPECT_EQ(Ask(Packet(kPut, Join({Length(2), Body(kHeaderBody, {1, 2, 3})}))), kBadRequest);
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderEndOfBody, {}))), kBadRequest);
  // A body shorter than announced.
  EXPECT_EQ(Ask(Packet(kPutFinal, Join({Length(5), Body(kHeaderEndOfBody, {1})}))), kBadRequest);
  // A Length beyond what is accepted, a name of odd byte count.
  EXPECT_EQ(Ask(Packet(kPutFinal, Length(100001))), kEntityTooLarge);
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderName, {0, 'a', 0}))), kBadRequest);
  // No body at all would be a delete; other operations are not offered.
  EXPECT_EQ(Ask(Packet(kPutFinal, Text(kHeaderName, "x"))), kNotImplemented);
  EXPECT_EQ(Ask(Packet(kGetFinal, Text(kHeaderName, "x"))), kNotImplemented);
  EXPECT_EQ(Ask(Bytes{0x80, 0x00, 0x05, 0x10, 0x00}), kBadRequest);  // short CONNECT
  EXPECT_EQ(Ask(Packet(kAbort, {})), kSuccess);
  EXPECT_EQ(Ask(Packet(kDisconnect, {})), kSuccess);
  Finish();
  EXPECT_TRUE(sink_.objects.empty());
}

TEST_F(Receiver, SizeLimitAndSinkRefusal) {
  EXPECT_EQ(Ask(Packet(kPut, Body(kHeaderBody, Bytes(60000)))), kContinue);
  EXPECT_EQ(Ask(Packet(kPutFinal, Body(kHeaderBody, Bytes(60000)))), kEntityTooLarge);
  sink_.answer = kForbidden;
  EXPECT_EQ(Ask(Packet(kPutFinal, Join({Text(kHeaderName, "n"), Body(kHeaderEndOfBody, {1})}))),
            kForbidden);
  Finish();
  EXPECT_EQ(sink_.objects.size(), 1u);
  EXPECT_EQ(summary_.accepted, 0);
}

TEST_F(Receiver, UnreadableLengthEndsTheSession) {
  EXPECT_EQ(Ask(Bytes{0x02, 0x00, 0x01}), kBadRequest);
  Finish();
  EXPECT_EQ(summary_.end, SessionEnd::kMalformed);
}

TEST_F(Receiver, PeerLeavingMidObjectDeliversNothing) {
  EXPECT_EQ(Ask(Packet(kPut, Join({Text(kHeaderName, "a.PDB"), Body(kHeaderBody, {1})}))),
            kContinue);
  int error = 0;
  SendPacket(*client_, Bytes{0x82, 0x00, 0x40, 0x49}, error);  // a packet cut short
  Finish();
  EXPECT_EQ(summary_.end, SessionEnd::kPeerClosed);
  EXPECT_TRUE(sink_.objects.empty());
}

TEST_F(Receiver, SilentPeerTimesOut) {
  int error = 0;
  SendPacket(*client_, Bytes{0x80, 0x00}, error);
  server_.join();  // bounded by the packet time-out
  EXPECT_EQ(summary_.end, SessionEnd::kFailed);
}

TEST(ReceiverAndSender, TakeWhatTheOtherSends) {
  MemoryTransport transport;
  int error = 0;
  auto listener = transport.Listen("rx", error);
  RecordingSink sink;
  std::thread server([&] {
    int e = 0;
    if (auto connection = listener->Accept(5000, e)) {
      ServeObexSession(*connection, sink, ServerOptions{2000, 100000});
    }
  });
  Bytes body(9000);
  for (size_t i = 0; i < body.size(); ++i) body[i] = static_cast<uint8_t>(i % 251);
  std::vector<HeaderItem> items;
  ASSERT_TRUE(ObjectItems("Kunden.PDB", "Kunden \xC3\xA9t\xC3\xA9.cxm", "QrTa", body, items));
  cx::testing::ScriptedUi ui;
  BeamWindows windows;
  EXPECT_EQ(RunTransfer(transport, ui, windows, items, std::chrono::seconds(10), 2000), 1);
  server.join();
  EXPECT_TRUE(ui.messages.empty());
  ASSERT_EQ(sink.objects.size(), 1u);
  EXPECT_EQ(sink.objects[0].name, "Kunden \xC3\xA9t\xC3\xA9.cxm");
  EXPECT_EQ(sink.objects[0].description, "Kunden.PDB");
  EXPECT_EQ(sink.objects[0].body, body);
}

}  // namespace
}  // namespace cx::obex
