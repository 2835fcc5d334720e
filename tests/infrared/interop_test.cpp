// Against openobex's obex_tcp, server and client, on its fixed port 650
// inside a private loopback-only network (obexftp, which can use any port,
// is in the round-trip tests). Skipped when the tool or the private network
// is missing.
#include <gtest/gtest.h>

#include <thread>

#include "infrared/beam_transfer.h"
#include "infrared/obex_server.h"
#include "platform/file_io.h"
#include "platform/tcp_transport.h"
#include "tests/infrared/peer_process.h"
#include "tests/infrared/scripted_peer.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ChildProcess;
using testing::FindTool;
using testing::RecordingSink;
using testing::TempDir;
using Bytes = std::vector<uint8_t>;

Bytes Pattern(size_t n) {
  Bytes b(n);
  for (size_t i = 0; i < n; ++i) b[i] = static_cast<uint8_t>((i * 31) ^ (i >> 8));
  return b;
}

#define REQUIRE_TOOL(var, name)                                  \
  std::string var = FindTool(name);                              \
  if (var.empty()) GTEST_SKIP() << name << " is not installed"

#define REQUIRE_PRIVATE_NETWORK()          \
  if (!testing::EnterPrivateNetwork()) \
  GTEST_SKIP() << "port 650 needs a private network namespace (root)"

// Serves one session at `address` in the background.
class Receiver {
 public:
  explicit Receiver(const std::string& address) {
    int error = 0;
    listener_ = transport_.Listen(address, error);
    if (!listener_) return;
    thread_ = std::thread([this] {
      int e = 0;
      if (auto c = listener_->Accept(10000, e)) obex::ServeObexSession(*c, sink, {5000, 1 << 20});
    });
  }
  ~Receiver() { Join(); }
  bool listening() const { return listener_ != nullptr; }
  std::string address() const { return listener_->address(); }
  void Join() {
    if (thread_.joinable()) thread_.join();
  }
  RecordingSink sink;

 private:
  TcpTransport transport_{{}};
  std::unique_ptr<StreamListener> listener_;
  std::thread thread_;
};

TEST(ObexTcpPeer, StoresWhatWeBeamInPacketsItAccepts) {
  REQUIRE_TOOL(tool, "obex_tcp");
  REQUIRE_PRIVATE_NETWORK();
  TempDir dir;
  ChildProcess server;
  ASSERT_TRUE(server.Start({tool}, dir.path(), dir.File("server.log")));
  // The device search keeps trying until the server listens.
  TcpTransport transport({"127.0.0.1:650"}, 500);
  testing::ScriptedUi ui;
  obex::BeamWindows windows;
  std::vector<obex::HeaderItem> items;
  Bytes body = Pattern(9000);  // far above the 1024 bytes it announces
  ASSERT_TRUE(obex::ObjectItems("Beamed.PDB", "Beamed.PDB", "lnch", body, items));
  EXPECT_EQ(obex::RunTransfer(transport, ui, windows, items, std::chrono::seconds(20), 5000), 1);
  server.Wait(std::chrono::seconds(3));
  Bytes stored;
  ASSERT_TRUE(ReadWholeFile(dir.File("Beamed.PDB"), stored));
  EXPECT_EQ(stored, body);
  for (const auto& m : ui.messages) ADD_FAILURE() << m.text;
}

TEST(ObexTcpPeer, ItsPushArrivesAtOurReceiver) {
  REQUIRE_TOOL(tool, "obex_tcp");
  REQUIRE_PRIVATE_NETWORK();
  TempDir dir;
  Bytes body = Pattern(3000);
  ASSERT_TRUE(WriteFileSafely(dir.File("Memo.txt"), body.data(), body.size()).ok());
  Receiver receiver("127.0.0.1:650");
  ASSERT_TRUE(receiver.listening());
  ChildProcess client;
  ASSERT_TRUE(client.Start({tool, "Memo.txt", "127.0.0.1"}, dir.path(), dir.File("client.log")));
  EXPECT_EQ(client.Wait(std::chrono::seconds(20)), 0);
  receiver.Join();
  ASSERT_EQ(receiver.sink.objects.size(), 1u);
  EXPECT_EQ(receiver.sink.objects[0].name, "Memo.txt");
  EXPECT_EQ(receiver.sink.objects[0].body, body);
}

}  // namespace
}  // namespace cx
