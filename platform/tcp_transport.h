// OBEX over TCP: the stream transport used where the machine has no
// infrared port. A "device search" tries the configured peers in turn; the
// first one that accepts a connection is the device found.
#pragma once

#include <string>
#include <vector>

#include "platform/transport.h"

namespace cx {

// The port OBEX over TCP uses when none is given.
constexpr int kDefaultObexTcpPort = 650;

// Splits "HOST", "HOST:PORT", "[IPV6]:PORT" or a bare IPv6 address. False
// when the text is empty or the port is not a number in 1..65535 (0 too
// with `allowPortZero`, which asks a listener for any free port).
bool ParseHostPort(const std::string& text, int defaultPort, std::string& host, int& port,
                   bool allowPortZero = false);

// A peer list as kept in the settings: entries separated by commas,
// semicolons or blanks; empty entries are dropped.
std::vector<std::string> ParsePeerList(const std::string& text);

class TcpTransport : public StreamTransport {
 public:
  // `peers` are "HOST[:PORT]" texts, tried in order. `connectTimeoutMs`
  // bounds each connection attempt of a search.
  explicit TcpTransport(std::vector<std::string> peers, int connectTimeoutMs = 1000);
  ~TcpTransport() override;
  TcpTransport(const TcpTransport&) = delete;
  TcpTransport& operator=(const TcpTransport&) = delete;

  int Open() override;
  // A peer that accepts during the search keeps that connection: one-shot
  // servers would otherwise spend their only connection on the probe.
  int FindDevices(std::vector<std::string>& devices) override;
  std::unique_ptr<StreamConnection> Connect(const std::string& device, int& error) override;
  // `address` is "HOST:PORT"; port 0 picks a free port.
  std::unique_ptr<StreamListener> Listen(const std::string& address, int& error) override;

 private:
  void DropPending();

  std::vector<std::string> peers_;
  int connectTimeoutMs_;
  int pendingFd_ = -1;
  std::string pendingPeer_;
};

}  // namespace cx
