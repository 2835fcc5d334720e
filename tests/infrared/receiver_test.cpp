// The listening side over real loopback sockets, with hostile peers: one
// that connects and sends nothing, one that floods requests and never reads
// a response. Every wait here is bounded.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <future>
#include <mutex>

#include "infrared/beam_transfer.h"
#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"
#include "infrared/receiver.h"
#include "platform/tcp_transport.h"
#include "tests/support/test_support.h"

namespace cx::obex {
namespace {

using Clock = std::chrono::steady_clock;
using namespace std::chrono_literals;

class CountingSink : public ObjectSink {
 public:
  uint8_t Deliver(ReceivedObject& object) override {
    std::lock_guard<std::mutex> lock(mutex_);
    names_.push_back(object.name);
    return kSuccess;
  }
  std::vector<std::string> names() {
    std::lock_guard<std::mutex> lock(mutex_);
    return names_;
  }

 private:
  std::mutex mutex_;
  std::vector<std::string> names_;
};

// A raw client socket to 127.0.0.1:port; -1 on failure.
int ConnectRaw(int port, int receiveBuffer = 0) {
  int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (fd < 0) return -1;
  if (receiveBuffer > 0) ::setsockopt(fd, SOL_SOCKET, SO_RCVBUF, &receiveBuffer, sizeof receiveBuffer);
  sockaddr_in to{};
  to.sin_family = AF_INET;
  to.sin_port = htons(static_cast<uint16_t>(port));
  to.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  if (::connect(fd, reinterpret_cast<sockaddr*>(&to), sizeof to) != 0) {
    ::close(fd);
    return -1;
  }
  return fd;
}

// Sends small PUT packets, a thousand at a time, until the receiver stops
// taking them: it is then stuck answering, since nobody reads its answers.
// False if that has not happened after far more than any socket buffers.
bool Flood(int fd) {
  ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) | O_NONBLOCK);
  const uint8_t put[] = {kPut, 0x00, 0x06, kHeaderBody, 0x00, 0x03};
  std::vector<uint8_t> batch;
  for (int i = 0; i < 1000; ++i) batch.insert(batch.end(), put, put + sizeof put);
  const auto end = Clock::now() + 20s;
  size_t pending = 0;  // bytes of a batch the socket took only in part
  for (size_t sent = 0; sent < (size_t{64} << 20) && Clock::now() < end;) {
    const ssize_t n = ::send(fd, batch.data() + pending, batch.size() - pending, MSG_NOSIGNAL);
    if (n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) {
      // Full for a moment may only mean the receiver is busy reading.
      pollfd p{fd, POLLOUT, 0};
      if (::poll(&p, 1, 200) == 0) return true;
      continue;
    }
    if (n <= 0) return false;
    sent += static_cast<size_t>(n);
    pending = (pending + static_cast<size_t>(n)) % batch.size();
  }
  return false;
}

// True once the receiver has closed the connection (what it had sent is
// read and dropped), false if that has not happened within `limit`.
bool ClosedWithin(int fd, std::chrono::milliseconds limit) {
  const auto end = Clock::now() + limit;
  char buffer[65536];
  while (Clock::now() < end) {
    pollfd p{fd, POLLIN, 0};
    if (::poll(&p, 1, 50) <= 0) continue;
    const ssize_t n = ::recv(fd, buffer, sizeof buffer, MSG_DONTWAIT);
    if (n == 0 || (n < 0 && errno != EAGAIN && errno != EINTR)) return true;
  }
  return false;
}

class Listening : public ::testing::Test {
 protected:
  // Starts the receiver and waits (bounded) until it listens.
  void Start() {
    options_.address = "127.0.0.1:0";
    options_.pollMs = 50;
    std::promise<std::string> address;
    auto heard = address.get_future();
    result_ = std::async(std::launch::async, [this, &address] {
      return RunReceiver(transport_, sink_, options_, stop_,
                         [&address](const std::string& a) { address.set_value(a); });
    });
    ASSERT_EQ(heard.wait_for(5s), std::future_status::ready);
    address_ = heard.get();
    port_ = std::stoi(address_.substr(address_.rfind(':') + 1));
  }
  // Beams one small object the way the program does; its answer.
  int Beam(const std::string& name) {
    TcpTransport transport({address_});
    testing::ScriptedUi ui;
    BeamWindows windows;
    std::vector<HeaderItem> items;
    if (!ObjectItems(name, name, "QrTa", std::vector<uint8_t>(100, 7), items)) return 0;
    return RunTransfer(transport, ui, windows, items, 10s, 5000);
  }
  void TearDown() override {
    stop_ = true;
    if (result_.valid()) result_.wait_for(10s);
    for (int fd : fds_) ::close(fd);
  }

  TcpTransport transport_{{}};
  CountingSink sink_;
  ReceiverOptions options_;
  std::atomic<bool> stop_{false};
  std::future<Status> result_;
  std::string address_;
  int port_ = 0;
  std::vector<int> fds_;
};

TEST_F(Listening, HostilePeersHoldUpNobodyAndStopEndsEverythingAtOnce) {
  // Long time-outs: only serving peers side by side lets the beam through.
  options_.server.packetTimeoutMs = 60000;
  options_.server.sendTimeoutMs = 60000;
  Start();
  fds_.push_back(ConnectRaw(port_));                 // says nothing
  fds_.push_back(ConnectRaw(port_, 4096));           // never reads
  ASSERT_GE(fds_[0], 0);
  ASSERT_GE(fds_[1], 0);
  ASSERT_TRUE(Flood(fds_[1]));
  const auto before = Clock::now();
  EXPECT_EQ(Beam("First.cxr"), 1);
  EXPECT_LT(Clock::now() - before, 5s);
  EXPECT_EQ(sink_.names(), std::vector<std::string>{"First.cxr"});

  // The flooding peer's session is stuck sending; a stop still ends it.
  const auto stopping = Clock::now();
  stop_ = true;
  ASSERT_EQ(result_.wait_for(3s), std::future_status::ready);
  EXPECT_LT(Clock::now() - stopping, 2s);
  EXPECT_TRUE(result_.get().ok());
}

TEST_F(Listening, PeersThatStallAreDroppedAndTheSessionLimitHolds) {
  options_.server.packetTimeoutMs = 400;
  options_.server.sendTimeoutMs = 400;
  options_.maxSessions = 2;
  Start();
  fds_.push_back(ConnectRaw(port_));
  fds_.push_back(ConnectRaw(port_, 4096));
  ASSERT_GE(fds_[0], 0);
  ASSERT_GE(fds_[1], 0);
  Flood(fds_[1]);
  // Both places are taken; the beam waits until the time-outs free one.
  EXPECT_EQ(Beam("Second.cxr"), 1);
  EXPECT_TRUE(ClosedWithin(fds_[0], 20s));
  EXPECT_TRUE(ClosedWithin(fds_[1], 20s));
  EXPECT_EQ(sink_.names(), std::vector<std::string>{"Second.cxr"});
}

TEST_F(Listening, CountEndsTheReceiverOnceEnoughHaveArrived) {
  options_.count = 2;
  Start();
  EXPECT_EQ(Beam("A.cxr"), 1);
  EXPECT_EQ(Beam("B.cxr"), 1);
  ASSERT_EQ(result_.wait_for(5s), std::future_status::ready);
  EXPECT_TRUE(result_.get().ok());
  EXPECT_EQ(sink_.names().size(), 2u);
}

}  // namespace
}  // namespace cx::obex
