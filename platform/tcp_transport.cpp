#include "platform/tcp_transport.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdlib>

namespace cx {
namespace {

std::string AddressText(const sockaddr_storage& addr) {
  char host[INET6_ADDRSTRLEN] = {};
  if (addr.ss_family == AF_INET6) {
    const auto* a = reinterpret_cast<const sockaddr_in6*>(&addr);
    ::inet_ntop(AF_INET6, &a->sin6_addr, host, sizeof host);
    return "[" + std::string(host) + "]:" + std::to_string(ntohs(a->sin6_port));
  }
  const auto* a = reinterpret_cast<const sockaddr_in*>(&addr);
  ::inet_ntop(AF_INET, &a->sin_addr, host, sizeof host);
  return std::string(host) + ":" + std::to_string(ntohs(a->sin_port));
}

// Waits for `events` on `fd`; 1 ready, 0 time-out, -1 error (errno set).
int WaitFor(int fd, short events, int timeoutMs) {
  pollfd p{fd, events, 0};
  for (;;) {
    int r = ::poll(&p, 1, timeoutMs);
    if (r < 0 && errno == EINTR) continue;
    return r;
  }
}

class TcpConnection : public StreamConnection {
 public:
  TcpConnection(int fd, std::string peer) : fd_(fd), peer_(std::move(peer)) {}
  ~TcpConnection() override { Close(); }

  long Send(const uint8_t* data, size_t size) override {
    if (fd_ < 0) return Fail(ENOTCONN);
    using Clock = std::chrono::steady_clock;
    const auto deadline = Clock::now() + std::chrono::milliseconds(sendTimeoutMs_ < 0 ? 0 : sendTimeoutMs_);
    size_t done = 0;
    while (done < size) {
      if (sendTimeoutMs_ >= 0) {
        const auto left =
            std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now()).count();
        const int ready = left > 0 ? WaitFor(fd_, POLLOUT, static_cast<int>(left)) : 0;
        if (ready <= 0) {
          error_ = ready == 0 ? ETIMEDOUT : errno;
          return done > 0 ? static_cast<long>(done) : -1;
        }
      }
      const int flags = MSG_NOSIGNAL | (sendTimeoutMs_ >= 0 ? MSG_DONTWAIT : 0);
      ssize_t n = ::send(fd_, data + done, size - done, flags);
      if (n < 0 && (errno == EINTR || errno == EAGAIN || errno == EWOULDBLOCK)) continue;
      if (n <= 0) {
        error_ = n < 0 ? errno : EPIPE;
        return done > 0 ? static_cast<long>(done) : -1;
      }
      done += static_cast<size_t>(n);
    }
    return static_cast<long>(done);
  }

  void SetSendTimeout(int timeoutMs) override { sendTimeoutMs_ = timeoutMs; }

  void Interrupt() override {
    if (fd_ >= 0) ::shutdown(fd_, SHUT_RDWR);
  }

  long Receive(uint8_t* data, size_t size, int timeoutMs) override {
    if (fd_ < 0) return Fail(ENOTCONN);
    int ready = WaitFor(fd_, POLLIN, timeoutMs);
    if (ready < 0) return Fail(errno);
    if (ready == 0) return Fail(ETIMEDOUT);
    for (;;) {
      ssize_t n = ::recv(fd_, data, size, 0);
      if (n < 0 && errno == EINTR) continue;
      if (n < 0) return Fail(errno);
      return static_cast<long>(n);
    }
  }

  void Close() override {
    if (fd_ < 0) return;
    ::shutdown(fd_, SHUT_RDWR);
    ::close(fd_);
    fd_ = -1;
  }

  int error() const override { return error_; }
  std::string peer() const override { return peer_; }

 private:
  long Fail(int error) {
    error_ = error;
    return -1;
  }

  // Read by Interrupt from another thread; it changes only in Close.
  std::atomic<int> fd_;
  std::string peer_;
  int error_ = 0;
  int sendTimeoutMs_ = -1;
};

class TcpListener : public StreamListener {
 public:
  TcpListener(int fd, std::string address) : fd_(fd), address_(std::move(address)) {}
  ~TcpListener() override { ::close(fd_); }

  std::unique_ptr<StreamConnection> Accept(int timeoutMs, int& error) override {
    int ready = WaitFor(fd_, POLLIN, timeoutMs);
    if (ready <= 0) {
      error = ready == 0 ? ETIMEDOUT : errno;
      return nullptr;
    }
    sockaddr_storage from{};
    socklen_t len = sizeof from;
    int fd = ::accept4(fd_, reinterpret_cast<sockaddr*>(&from), &len, SOCK_CLOEXEC);
    if (fd < 0) {
      error = errno;
      return nullptr;
    }
    return std::make_unique<TcpConnection>(fd, AddressText(from));
  }

  std::string address() const override { return address_; }

 private:
  int fd_;
  std::string address_;
};

// Resolves HOST[:PORT]; false when the text or the name is unusable.
bool Resolve(const std::string& text, bool passive, addrinfo** out) {
  std::string host;
  int port = 0;
  if (!ParseHostPort(text, kDefaultObexTcpPort, host, port, passive)) return false;
  addrinfo hints{};
  hints.ai_family = AF_UNSPEC;
  hints.ai_socktype = SOCK_STREAM;
  hints.ai_flags = AI_NUMERICSERV | (passive ? AI_PASSIVE : 0);
  std::string service = std::to_string(port);
  return ::getaddrinfo(host.c_str(), service.c_str(), &hints, out) == 0;
}

// One bounded connection attempt: the connected descriptor, or -1 (errno).
int ConnectWithin(const addrinfo& ai, int timeoutMs) {
  int fd = ::socket(ai.ai_family, ai.ai_socktype | SOCK_CLOEXEC | SOCK_NONBLOCK, ai.ai_protocol);
  if (fd < 0) return -1;
  if (::connect(fd, ai.ai_addr, ai.ai_addrlen) != 0) {
    if (errno != EINPROGRESS) {
      int e = errno;
      ::close(fd);
      errno = e;
      return -1;
    }
    int soError = 0;
    socklen_t len = sizeof soError;
    int ready = WaitFor(fd, POLLOUT, timeoutMs);
    if (ready <= 0 || ::getsockopt(fd, SOL_SOCKET, SO_ERROR, &soError, &len) != 0 || soError) {
      int e = ready == 0 ? ETIMEDOUT : (soError ? soError : errno);
      ::close(fd);
      errno = e;
      return -1;
    }
  }
  ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) & ~O_NONBLOCK);
  return fd;
}

// Tries every address of `peer`; the descriptor or -1 with `error` set.
int ConnectPeer(const std::string& peer, int timeoutMs, int& error) {
  addrinfo* list = nullptr;
  if (!Resolve(peer, false, &list)) {
    error = EHOSTUNREACH;
    return -1;
  }
  int fd = -1;
  error = ECONNREFUSED;
  for (addrinfo* ai = list; ai && fd < 0; ai = ai->ai_next) {
    fd = ConnectWithin(*ai, timeoutMs);
    if (fd < 0) error = errno;
  }
  ::freeaddrinfo(list);
  return fd;
}

}  // namespace

bool ParseHostPort(const std::string& text, int defaultPort, std::string& host, int& port,
                   bool allowPortZero) {
  std::string portText;
  if (!text.empty() && text.front() == '[') {
    size_t close = text.find(']');
    if (close == std::string::npos) return false;
    host = text.substr(1, close - 1);
    if (close + 1 < text.size()) {
      if (text[close + 1] != ':') return false;
      portText = text.substr(close + 2);
      if (portText.empty()) return false;
    }
  } else if (size_t colon = text.rfind(':');
             colon != std::string::npos && text.find(':') == colon) {
    host = text.substr(0, colon);
    portText = text.substr(colon + 1);
    if (portText.empty()) return false;
  } else {
    host = text;  // a name, an IPv4 address or a bare IPv6 address
  }
  if (host.empty()) return false;
  port = defaultPort;
  if (!portText.empty()) {
    char* end = nullptr;
    long value = std::strtol(portText.c_str(), &end, 10);
    if (*end != '\0' || value < (allowPortZero ? 0 : 1) || value > 65535) return false;
    port = static_cast<int>(value);
  }
  return true;
}

std::vector<std::string> ParsePeerList(const std::string& text) {
  std::vector<std::string> peers;
  std::string current;
  for (char c : text + ",") {
    if (c == ',' || c == ';' || c == ' ' || c == '\t' || c == '\n' || c == '\r') {
      if (!current.empty()) peers.push_back(current);
      current.clear();
    } else {
      current += c;
    }
  }
  return peers;
}

TcpTransport::TcpTransport(std::vector<std::string> peers, int connectTimeoutMs)
    : peers_(std::move(peers)), connectTimeoutMs_(connectTimeoutMs) {}

TcpTransport::~TcpTransport() { DropPending(); }

void TcpTransport::DropPending() {
  if (pendingFd_ >= 0) ::close(pendingFd_);
  pendingFd_ = -1;
  pendingPeer_.clear();
}

int TcpTransport::Open() {
  // What the infrared port checked here (a socket can be had at all).
  int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (fd < 0) return errno;
  ::close(fd);
  return 0;
}

int TcpTransport::FindDevices(std::vector<std::string>& devices) {
  devices.clear();
  DropPending();
  for (const std::string& peer : peers_) {
    std::string host;
    int port = 0;
    if (!ParseHostPort(peer, kDefaultObexTcpPort, host, port)) return EINVAL;
    int error = 0;
    int fd = ConnectPeer(peer, connectTimeoutMs_, error);
    if (fd < 0) {
      if (error == EMFILE || error == ENFILE || error == ENOBUFS || error == ENOMEM) return error;
      continue;  // not listening: not in range
    }
    pendingFd_ = fd;
    pendingPeer_ = peer;
    devices.push_back(peer);
    break;
  }
  return 0;
}

std::unique_ptr<StreamConnection> TcpTransport::Connect(const std::string& device, int& error) {
  if (pendingFd_ >= 0 && pendingPeer_ == device) {
    int fd = pendingFd_;
    pendingFd_ = -1;
    pendingPeer_.clear();
    return std::make_unique<TcpConnection>(fd, device);
  }
  DropPending();
  int fd = ConnectPeer(device, connectTimeoutMs_, error);
  if (fd < 0) return nullptr;
  return std::make_unique<TcpConnection>(fd, device);
}

std::unique_ptr<StreamListener> TcpTransport::Listen(const std::string& address, int& error) {
  addrinfo* list = nullptr;
  if (!Resolve(address, true, &list)) {
    error = EINVAL;
    return nullptr;
  }
  int fd = ::socket(list->ai_family, list->ai_socktype | SOCK_CLOEXEC, list->ai_protocol);
  int one = 1;
  bool ok = fd >= 0 && ::setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &one, sizeof one) == 0 &&
            ::bind(fd, list->ai_addr, list->ai_addrlen) == 0 && ::listen(fd, 16) == 0;
  error = ok ? 0 : errno;
  ::freeaddrinfo(list);
  if (!ok) {
    if (fd >= 0) ::close(fd);
    return nullptr;
  }
  sockaddr_storage bound{};
  socklen_t len = sizeof bound;
  ::getsockname(fd, reinterpret_cast<sockaddr*>(&bound), &len);
  return std::make_unique<TcpListener>(fd, AddressText(bound));
}

}  // namespace cx
