#include "infrared/memory_transport.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <condition_variable>

namespace cx {
namespace {

// One direction of a connection.
struct Pipe {
  std::mutex mutex;
  std::condition_variable changed;
  std::deque<uint8_t> bytes;
  bool writerClosed = false;
  bool readerClosed = false;
};

class MemoryConnection : public StreamConnection {
 public:
  MemoryConnection(std::shared_ptr<Pipe> in, std::shared_ptr<Pipe> out, std::string peer)
      : in_(std::move(in)), out_(std::move(out)), peer_(std::move(peer)) {}
  ~MemoryConnection() override { Close(); }

  long Send(const uint8_t* data, size_t size) override {
    std::lock_guard<std::mutex> lock(out_->mutex);
    if (closed_ || out_->readerClosed) {
      error_ = EPIPE;
      return -1;
    }
    out_->bytes.insert(out_->bytes.end(), data, data + size);
    out_->changed.notify_all();
    return static_cast<long>(size);
  }

  long Receive(uint8_t* data, size_t size, int timeoutMs) override {
    std::unique_lock<std::mutex> lock(in_->mutex);
    if (closed_) {
      error_ = ENOTCONN;
      return -1;
    }
    bool ready = in_->changed.wait_for(lock, std::chrono::milliseconds(timeoutMs), [&] {
      return !in_->bytes.empty() || in_->writerClosed;
    });
    if (!ready) {
      error_ = ETIMEDOUT;
      return -1;
    }
    size_t n = std::min(size, in_->bytes.size());
    std::copy_n(in_->bytes.begin(), n, data);
    in_->bytes.erase(in_->bytes.begin(), in_->bytes.begin() + static_cast<long>(n));
    return static_cast<long>(n);
  }

  void Close() override {
    if (closed_) return;
    closed_ = true;
    for (Pipe* pipe : {in_.get(), out_.get()}) {
      std::lock_guard<std::mutex> lock(pipe->mutex);
      (pipe == in_.get() ? pipe->readerClosed : pipe->writerClosed) = true;
      pipe->changed.notify_all();
    }
  }

  int error() const override { return error_; }
  std::string peer() const override { return peer_; }

 private:
  std::shared_ptr<Pipe> in_;
  std::shared_ptr<Pipe> out_;
  std::string peer_;
  bool closed_ = false;
  int error_ = 0;
};

}  // namespace

// Connections waiting to be accepted, per listener name.
struct MemoryTransport::Shared {
  std::mutex mutex;
  std::condition_variable arrived;
  std::map<std::string, std::deque<std::unique_ptr<StreamConnection>>> waiting;
};

std::shared_ptr<MemoryTransport::Shared> MemoryTransport::MakeShared() {
  return std::make_shared<Shared>();
}

namespace {

class MemoryListener : public StreamListener {
 public:
  MemoryListener(std::shared_ptr<MemoryTransport::Shared> shared, std::string name)
      : shared_(std::move(shared)), name_(std::move(name)) {}
  ~MemoryListener() override {
    std::lock_guard<std::mutex> lock(shared_->mutex);
    shared_->waiting.erase(name_);
  }

  std::unique_ptr<StreamConnection> Accept(int timeoutMs, int& error) override {
    std::unique_lock<std::mutex> lock(shared_->mutex);
    auto& queue = shared_->waiting[name_];
    if (!shared_->arrived.wait_for(lock, std::chrono::milliseconds(timeoutMs),
                                   [&] { return !queue.empty(); })) {
      error = ETIMEDOUT;
      return nullptr;
    }
    auto connection = std::move(queue.front());
    queue.pop_front();
    return connection;
  }

  std::string address() const override { return name_; }

 private:
  std::shared_ptr<MemoryTransport::Shared> shared_;
  std::string name_;
};

}  // namespace

int MemoryTransport::Open() {
  std::lock_guard<std::mutex> lock(mutex_);
  return openError_;
}

int MemoryTransport::FindDevices(std::vector<std::string>& devices) {
  devices.clear();
  {
    std::lock_guard<std::mutex> lock(mutex_);
    ++searches_;
    if (searchError_ != 0) return searchError_;
    if (hiddenSearches_ > 0) {
      --hiddenSearches_;
      return 0;
    }
  }
  std::lock_guard<std::mutex> lock(shared_->mutex);
  for (const auto& [name, queue] : shared_->waiting) devices.push_back(name);
  return 0;
}

std::unique_ptr<StreamConnection> MemoryTransport::Connect(const std::string& device,
                                                           int& error) {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    if (!connectErrors_.empty()) {
      error = connectErrors_.front();
      connectErrors_.pop_front();
      return nullptr;
    }
  }
  std::lock_guard<std::mutex> lock(shared_->mutex);
  auto it = shared_->waiting.find(device);
  if (it == shared_->waiting.end()) {
    error = ECONNREFUSED;
    return nullptr;
  }
  auto toServer = std::make_shared<Pipe>();
  auto toClient = std::make_shared<Pipe>();
  it->second.push_back(std::make_unique<MemoryConnection>(toServer, toClient, "client"));
  shared_->arrived.notify_all();
  return std::make_unique<MemoryConnection>(toClient, toServer, device);
}

std::unique_ptr<StreamListener> MemoryTransport::Listen(const std::string& address, int& error) {
  std::lock_guard<std::mutex> lock(shared_->mutex);
  if (shared_->waiting.count(address)) {
    error = EADDRINUSE;
    return nullptr;
  }
  shared_->waiting[address];
  return std::make_unique<MemoryListener>(shared_, address);
}

void MemoryTransport::SetOpenError(int error) {
  std::lock_guard<std::mutex> lock(mutex_);
  openError_ = error;
}

void MemoryTransport::HideDevicesFor(int count) {
  std::lock_guard<std::mutex> lock(mutex_);
  hiddenSearches_ = count;
}

void MemoryTransport::SetSearchError(int error) {
  std::lock_guard<std::mutex> lock(mutex_);
  searchError_ = error;
}

void MemoryTransport::FailNextConnects(std::vector<int> errors) {
  std::lock_guard<std::mutex> lock(mutex_);
  connectErrors_.assign(errors.begin(), errors.end());
}

int MemoryTransport::searches() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return searches_;
}

}  // namespace cx
