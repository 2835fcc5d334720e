// OBEX over TCP on the loopback interface.
#include <gtest/gtest.h>

#include <cerrno>
#include <thread>

#include "platform/tcp_transport.h"

namespace cx {
namespace {

TEST(TcpTransport, PeerAddresses) {
  std::string host;
  int port = 0;
  ASSERT_TRUE(ParseHostPort("127.0.0.1", 650, host, port));
  EXPECT_EQ(host, "127.0.0.1");
  EXPECT_EQ(port, 650);
  ASSERT_TRUE(ParseHostPort("localhost:6500", 650, host, port));
  EXPECT_EQ(host, "localhost");
  EXPECT_EQ(port, 6500);
  ASSERT_TRUE(ParseHostPort("[::1]:651", 650, host, port));
  EXPECT_EQ(host, "::1");
  EXPECT_EQ(port, 651);
  ASSERT_TRUE(ParseHostPort("::1", 650, host, port));
  EXPECT_EQ(host, "::1");
  EXPECT_EQ(port, 650);
  for (const char* bad : {"", ":650", "h:", "h:0", "h:65536", "h:6x", "[::1", "[::1]x"}) {
    EXPECT_FALSE(ParseHostPort(bad, 650, host, port)) << bad;
  }
  EXPECT_EQ(ParsePeerList(" 127.0.0.1:7000, [::1]:7001;;host\n"),
            (std::vector<std::string>{"127.0.0.1:7000", "[::1]:7001", "host"}));
}

TEST(TcpTransport, SearchFindsTheFirstPeerThatAnswers) {
  TcpTransport server({});
  int error = 0;
  auto listener = server.Listen("127.0.0.1:0", error);
  ASSERT_TRUE(listener) << error;
  std::string live = listener->address();
  // A port nobody listens on: one that was just given up.
  std::string dead;
  {
    auto gone = server.Listen("127.0.0.1:0", error);
    ASSERT_TRUE(gone);
    dead = gone->address();
  }
  TcpTransport client({dead, live}, 500);
  EXPECT_EQ(client.Open(), 0);
  std::vector<std::string> devices;
  ASSERT_EQ(client.FindDevices(devices), 0);
  ASSERT_EQ(devices, std::vector<std::string>{live});
  // The connection made while searching is the one handed out: a server
  // that accepts once still gets the transfer.
  auto accepted = listener->Accept(2000, error);
  ASSERT_TRUE(accepted);
  auto connection = client.Connect(devices[0], error);
  ASSERT_TRUE(connection);
  const uint8_t hello[] = {1, 2, 3};
  EXPECT_EQ(connection->Send(hello, 3), 3);
  uint8_t got[8] = {};
  EXPECT_EQ(accepted->Receive(got, sizeof got, 2000), 3);
  EXPECT_EQ(accepted->Receive(got, sizeof got, 50), -1);
  EXPECT_EQ(accepted->error(), ETIMEDOUT);
  connection->Close();
  EXPECT_EQ(accepted->Receive(got, sizeof got, 2000), 0);
  // Writing to a peer that has gone fails instead of raising SIGPIPE.
  bool failed = false;
  for (int i = 0; i < 50 && !failed; ++i) {
    failed = accepted->Send(hello, 3) < 3;
    if (!failed) std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  EXPECT_TRUE(failed);

  TcpTransport nobody({dead}, 500);
  ASSERT_EQ(nobody.FindDevices(devices), 0);
  EXPECT_TRUE(devices.empty());
  EXPECT_EQ(TcpTransport({"h:0"}).FindDevices(devices), EINVAL);
}

}  // namespace
}  // namespace cx
