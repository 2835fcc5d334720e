// Two installations on one machine: one beams, the other receives, over
// TCP on the loopback interface; and the receiver against obexftp.
#include <gtest/gtest.h>

#include <thread>

#include "design/receive_access.h"
#include "infrared/beam_commands.h"
#include "infrared/receiver.h"
#include "platform/file_io.h"
#include "platform/tcp_transport.h"
#include "tests/infrared/peer_process.h"
#include "tests/infrared/sample_databases.h"
#include "tests/support/test_support.h"

namespace cx::obex {
namespace {

using cx::testing::RecordsOf;
using cx::testing::TwoTextRecord;
using cx::testing::WriteSampleDatabase;
using Bytes = std::vector<uint8_t>;

// The receiving installation: its own data folder, a user who always gives
// the same answer, and a listener on a free loopback port.
class Installation {
 public:
  Installation(const std::string& folder, int count, bool answer = true) {
    ui.yesNoAnswers.assign(8, answer);
    ReceiverOptions options;
    options.address = "127.0.0.1:0";
    options.count = count;
    options.server.packetTimeoutMs = 5000;
    thread_ = std::thread([this, folder, options] {
      status = ReceiveIntoDataFolder(
          folder, ui, hooks_, options, stop_,
          [this](const std::string& a) {
            address = a;
            ready_ = true;
          },
          [this](const std::string& l) { lines.push_back(l); });
      ready_ = true;
    });
    for (int i = 0; i < 500 && !ready_; ++i) std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  ~Installation() {
    stop_ = true;
    Join();
  }
  void Join() {
    if (thread_.joinable()) thread_.join();
  }

  cx::testing::ScriptedUi ui;
  std::vector<std::string> lines;
  std::string address;
  Status status;

 private:
  AccessCheckedReceiveHooks hooks_;
  std::atomic<bool> stop_{false};
  std::atomic<bool> ready_{false};
  std::thread thread_;
};

class RoundTrip : public ::testing::Test {
 protected:
  Status Beam(const std::string& path, BeamWhat what, size_t record, const std::string& to) {
    BeamOptions options;
    options.wait = std::chrono::seconds(20);
    options.replyTimeoutMs = 5000;
    return BeamFile(path, what, record, {to}, ui_, options);
  }
  cx::testing::TempDir dir_;
  cx::testing::ScriptedUi ui_;
};

TEST_F(RoundTrip, DatabaseRecordAndRecordsInView) {
  std::vector<Bytes> records;
  for (int i = 0; i < 40; ++i) records.push_back(TwoTextRecord("name " + std::to_string(i), std::string(300, 'a' + i % 26)));
  std::string sent = WriteSampleDatabase(dir_.File("a"), "Stock.PDB", records);
  ASSERT_GT(FileSize(sent), 4072 * 2);

  Installation b(dir_.File("b"), 3);
  ASSERT_FALSE(b.address.empty()) << b.status.message();
  EXPECT_TRUE(Beam(sent, BeamWhat::kDatabase, 0, b.address)) << ui_.messages.size();
  EXPECT_TRUE(Beam(sent, BeamWhat::kRecord, 7, b.address));
  EXPECT_TRUE(Beam(sent, BeamWhat::kRecordsInView, 0, b.address));
  b.Join();
  EXPECT_TRUE(b.status);
  EXPECT_TRUE(ui_.messages.empty());

  std::vector<Bytes> expected = records;
  expected.push_back(records[7]);
  expected.insert(expected.end(), records.begin(), records.end());
  EXPECT_EQ(RecordsOf(dir_.File("b") + "/Stock.PDB"), expected);
  EXPECT_EQ(b.lines, (std::vector<std::string>{"Stored Stock.PDB",
                                                "Inserted 1 of 1 records into Stock.PDB",
                                                "Inserted 40 of 40 records into Stock.PDB"}));
}

TEST_F(RoundTrip, RefusalIsReportedToTheSender) {
  std::string sent = WriteSampleDatabase(dir_.File("a"), "Stock.PDB", {TwoTextRecord("x", "y")});
  Installation b(dir_.File("b"), 1, false);
  Status status = Beam(sent, BeamWhat::kDatabase, 0, b.address);
  EXPECT_FALSE(status);
  ASSERT_EQ(ui_.messages.size(), 1u);
  EXPECT_EQ(ui_.messages[0].text, "SendObexPacket: Incorrect OBEX Response = C3");
  b.Join();
  EXPECT_TRUE(ListFiles(dir_.File("b")).empty());
}

TEST_F(RoundTrip, PeerVanishingMidDatabaseLeavesNothing) {
  Installation b(dir_.File("b"), 0);
  TcpTransport raw({b.address}, 500);
  int error = 0;
  auto c = raw.Connect(b.address, error);
  ASSERT_TRUE(c);
  const uint8_t put[] = {0x02, 0x00, 0x13, 0x01, 0x00, 0x0B, 0, 'A', 0, '.', 0, 'P', 0, 'D', 0, 'B',
                         0x48, 0x00, 0x40};  // the body header runs past the packet
  c->Send(put, sizeof put);
  uint8_t reply[3] = {};
  EXPECT_EQ(c->Receive(reply, 3, 5000), 3);
  EXPECT_EQ(reply[0], 0xC0);
  const uint8_t half[] = {0x02, 0x10, 0x00, 0x48, 0x0F, 0xFD, 1, 2, 3};
  c->Send(half, sizeof half);
  c->Close();
  std::this_thread::sleep_for(std::chrono::milliseconds(100));
  EXPECT_TRUE(ListFiles(dir_.File("b")).empty());
  EXPECT_TRUE(b.lines.empty());
}

TEST_F(RoundTrip, ObexFtpPushesADatabaseIntoTheDataFolder) {
  std::string tool = cx::testing::FindTool("obexftp");
  if (tool.empty()) GTEST_SKIP() << "obexftp is not installed";
  std::string sent = WriteSampleDatabase(dir_.File("a"), "Stock.PDB",
                                         {TwoTextRecord("x", std::string(3000, 'y'))});
  Installation b(dir_.File("b"), 1);
  cx::testing::ChildProcess client;
  ASSERT_TRUE(client.Start({tool, "-U", "none", "-n", b.address, "-p", "Stock.PDB"},
                           dir_.File("a"), dir_.File("obexftp.log")));
  EXPECT_EQ(client.Wait(std::chrono::seconds(20)), 255);
  b.Join();
  Bytes original, stored;
  ASSERT_TRUE(ReadWholeFile(sent, original));
  ASSERT_TRUE(ReadWholeFile(dir_.File("b") + "/Stock.PDB", stored));
  EXPECT_EQ(stored, original);
}

}  // namespace
}  // namespace cx::obex
