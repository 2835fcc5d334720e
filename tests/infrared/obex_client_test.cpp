// The sender against a scripted peer: the packet sequence, replies it does
// not like, small peers, and the device search.
#include <gtest/gtest.h>

#include <cerrno>
#include <chrono>
#include <thread>

#include "infrared/beam_transfer.h"
#include "infrared/memory_transport.h"
#include "infrared/obex_client.h"
#include "infrared/obex_format.h"
#include "tests/infrared/scripted_peer.h"
#include "tests/support/test_support.h"

namespace cx::obex {
namespace {

using cx::testing::ScriptedPeer;
using cx::testing::ScriptedUi;
using Bytes = std::vector<uint8_t>;
using Sizes = std::vector<size_t>;

class Sender : public ::testing::Test {
 protected:
  std::unique_ptr<StreamListener> Listen(const std::string& name = "peer") {
    int error = 0;
    return transport_.Listen(name, error);
  }
  int Send(Bytes body) {
    std::vector<HeaderItem> items;
    EXPECT_TRUE(ObjectItems("d", "n", "QrTa", std::move(body), items));
    ObexLink link{transport_, ui_, windows_, cancel_, abandoned_, 2000, 1};
    return PutObexInfo(items, link);
  }

  MemoryTransport transport_;
  ScriptedUi ui_;
  BeamWindows windows_;
  std::atomic<bool> cancel_{false};
  std::atomic<bool> abandoned_{false};
};

Bytes Pattern(size_t n) {
  Bytes b(n);
  for (size_t i = 0; i < n; ++i) b[i] = static_cast<uint8_t>(i * 7 + 1);
  return b;
}

TEST_F(Sender, BodyOfExactly4072BytesGoesInOnePut) {
  ScriptedPeer peer(Listen());
  EXPECT_EQ(Send(Pattern(4072)), 1);
  // CONNECT, header PUT, one body PUT of 4072 + 6, PUT final, DISCONNECT.
  EXPECT_EQ(peer.Lengths(), (Sizes{7, 3 + 7 + 7 + 5 + 5, 4078, 6, 3}));
  const Bytes& body = peer.Packets()[2];
  EXPECT_EQ(Bytes(body.begin(), body.begin() + 6), (Bytes{0x02, 0x0F, 0xEE, 0x48, 0x0F, 0xEB}));
  EXPECT_EQ(Bytes(body.begin() + 6, body.end()), Pattern(4072));
  EXPECT_TRUE(ui_.messages.empty());
}

TEST_F(Sender, BodyOf4073BytesGoesIn4066AndThen7) {
  ScriptedPeer peer(Listen());
  EXPECT_EQ(Send(Pattern(4073)), 1);
  EXPECT_EQ(peer.Lengths(), (Sizes{7, 27, 4072, 13, 6, 3}));
  const auto& p = peer.Packets();
  EXPECT_EQ(Bytes(p[2].begin(), p[2].begin() + 6), (Bytes{0x02, 0x0F, 0xE8, 0x48, 0x0F, 0xE5}));
  EXPECT_EQ(Bytes(p[3].begin(), p[3].begin() + 6), (Bytes{0x02, 0x00, 0x0D, 0x48, 0x00, 0x0A}));
  Bytes joined(p[2].begin() + 6, p[2].end());
  joined.insert(joined.end(), p[3].begin() + 6, p[3].end());
  EXPECT_EQ(joined, Pattern(4073));
  EXPECT_EQ(p[4], (Bytes{0x82, 0x00, 0x06, 0x49, 0x00, 0x03}));
  EXPECT_EQ(p[5], (Bytes{0x81, 0x00, 0x03}));
}

TEST_F(Sender, PeerAnsweringC0StillGetsEveryPacket) {
  ScriptedPeer peer(Listen(), 4072, [](const Bytes& p, size_t) {
    return p[0] == kPut ? kBadRequest : cx::testing::ExpectedAnswer(p);
  });
  EXPECT_EQ(Send(Pattern(9000)), 1);
  EXPECT_EQ(peer.Lengths(), (Sizes{7, 27, 4072, 4072, 874, 6, 3}));
  ASSERT_EQ(ui_.messages.size(), 4u);  // the header PUT and three body parts
  for (const auto& m : ui_.messages) {
    EXPECT_EQ(m.text, "SendObexPacket: Incorrect OBEX Response = C0");
    EXPECT_EQ(m.caption, "Client");
  }
}

TEST_F(Sender, PeerWithSmallPacketsNeverGetsMore) {
  ScriptedPeer peer(Listen(), 1024);
  EXPECT_EQ(Send(Pattern(3000)), 1);
  EXPECT_EQ(peer.Lengths(), (Sizes{7, 27, 1024, 1024, 970, 6, 3}));
  Bytes joined;
  for (size_t i = 2; i < 5; ++i) joined.insert(joined.end(), peer.Packets()[i].begin() + 6, peer.Packets()[i].end());
  EXPECT_EQ(joined, Pattern(3000));
}

TEST_F(Sender, PeerThatHangsUpIsReportedAndTheSequenceRunsOut) {
  ScriptedPeer peer(Listen());
  peer.HangUpAfter(2);  // after the header PUT, unanswered
  EXPECT_EQ(Send(Pattern(10)), 1);
  EXPECT_EQ(peer.Lengths(), (Sizes{7, 27}));
  ASSERT_GE(ui_.messages.size(), 2u);
  EXPECT_EQ(ui_.messages[0].text, "SendObexPacket: No data is received, recv failed - 104");
  EXPECT_EQ(ui_.messages[1].text, "SendObexPacket: Sending First Packet failed. Error: 32");
  EXPECT_EQ(ui_.messages[1].caption, "Error");
}

TEST_F(Sender, CancelWhileNoDeviceIsInRangeEndsSilently) {
  BeamTransfer transfer(transport_, ui_, windows_, 1000);
  std::vector<HeaderItem> items;
  ASSERT_TRUE(ObjectItems("d", "n", "QrTa", Pattern(5), items));
  transfer.Start(items);
  for (int i = 0; i < 200 && transport_.searches() < 2; ++i) {
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  EXPECT_FALSE(transfer.Wait(std::chrono::milliseconds(0)));
  transfer.Cancel();
  ASSERT_TRUE(transfer.Wait(std::chrono::seconds(5)));
  EXPECT_EQ(transfer.result(), 0);
  EXPECT_TRUE(ui_.messages.empty());
}

TEST_F(Sender, SearchGoesOnUntilADeviceAppearsAndAfterAnAbortedConnect) {
  transport_.HideDevicesFor(3);
  transport_.FailNextConnects({ECONNABORTED});
  ScriptedPeer peer(Listen());
  EXPECT_EQ(Send(Pattern(1)), 1);
  EXPECT_EQ(transport_.searches(), 5);
  EXPECT_EQ(peer.Lengths().size(), 5u);
  EXPECT_TRUE(ui_.messages.empty());
}

TEST_F(Sender, SearchAndConnectFailuresNameInitIrSock) {
  transport_.SetOpenError(EMFILE);
  EXPECT_EQ(Send(Pattern(1)), 0);
  transport_.SetOpenError(0);
  transport_.SetSearchError(ENETDOWN);
  EXPECT_EQ(Send(Pattern(1)), 0);
  transport_.SetSearchError(0);
  auto listener = Listen();
  transport_.FailNextConnects({ECONNREFUSED});
  EXPECT_EQ(Send(Pattern(1)), 0);
  ASSERT_EQ(ui_.messages.size(), 3u);
  EXPECT_EQ(ui_.messages[0].text, "InitIrSock: Allocating socket failed. Error: 24");
  EXPECT_EQ(ui_.messages[1].text, "InitIrSock: Error looking for IR device. Error code: 100");
  EXPECT_EQ(ui_.messages[2].text,
            "InitIrSock: Connecting to the IR port failed - port may in use by another program. "
            "Error: 111");
  for (const auto& m : ui_.messages) EXPECT_EQ(m.caption, "Error");
}

TEST_F(Sender, GivingUpEndsTheTransferQuietly) {
  auto listener = Listen();  // accepts nothing: every reply times out
  BeamTransfer transfer(transport_, ui_, windows_, 200);
  std::vector<HeaderItem> items;
  ASSERT_TRUE(ObjectItems("d", "n", "QrTa", Pattern(5), items));
  transfer.Start(items);
  EXPECT_FALSE(transfer.Wait(std::chrono::milliseconds(50)));
  transfer.GiveUp();
  ASSERT_TRUE(transfer.Wait(std::chrono::seconds(5)));
  EXPECT_EQ(transfer.result(), 0);
  EXPECT_LE(ui_.messages.size(), 1u);
}

}  // namespace
}  // namespace cx::obex
