#include "infrared/receiver.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <cstring>
#include <list>
#include <mutex>
#include <system_error>

#include "infrared/receive_store.h"
#include "platform/tcp_transport.h"

namespace cx::obex {

namespace {

// Hands objects to the real sink one at a time, whichever session they
// arrived on, and counts them.
class SerialSink : public ObjectSink {
 public:
  explicit SerialSink(ObjectSink& sink) : sink_(sink) {}
  uint8_t Deliver(ReceivedObject& object) override {
    std::lock_guard<std::mutex> lock(mutex_);
    ++arrived_;
    return sink_.Deliver(object);
  }
  int arrived() const { return arrived_; }

 private:
  ObjectSink& sink_;
  std::mutex mutex_;
  std::atomic<int> arrived_{0};
};

struct Session {
  std::unique_ptr<StreamConnection> peer;
  std::thread thread;
  std::atomic<bool> done{false};
};

}  // namespace

Status RunReceiver(StreamTransport& transport, ObjectSink& sink, const ReceiverOptions& options,
                   const std::atomic<bool>& stop,
                   const std::function<void(const std::string&)>& listening) {
  int error = 0;
  std::unique_ptr<StreamListener> listener = transport.Listen(options.address, error);
  if (!listener) {
    return Status::Error("Cannot listen on " + options.address + ": " + std::strerror(error));
  }
  if (listening) listening(listener->address());
  ServerOptions server = options.server;
  server.stop = &stop;
  SerialSink serial(sink);
  std::mutex mutex;
  std::condition_variable sessionEnded;
  std::list<Session> sessions;
  const size_t most = static_cast<size_t>(std::max(1, options.maxSessions));

  auto reap = [&] {
    for (auto it = sessions.begin(); it != sessions.end();) {
      if (!it->done) {
        ++it;
        continue;
      }
      it->thread.join();
      it->peer->Close();
      it = sessions.erase(it);
    }
  };
  auto enough = [&] { return options.count > 0 && serial.arrived() >= options.count; };

  Status status = Status::Ok();
  while (!stop && !enough()) {
    reap();
    if (sessions.size() >= most) {
      std::unique_lock<std::mutex> lock(mutex);
      sessionEnded.wait_for(lock, std::chrono::milliseconds(options.pollMs));
      continue;
    }
    std::unique_ptr<StreamConnection> peer = listener->Accept(options.pollMs, error);
    if (!peer) {
      if (error == ETIMEDOUT || error == EINTR || error == ECONNABORTED) continue;
      // Out of descriptors or memory: wait for a session to give some back.
      if ((error == EMFILE || error == ENFILE || error == ENOBUFS || error == ENOMEM) &&
          !sessions.empty()) {
        std::unique_lock<std::mutex> lock(mutex);
        sessionEnded.wait_for(lock, std::chrono::milliseconds(options.pollMs));
        continue;
      }
      status = Status::Error(std::string("Receiving stopped: ") + std::strerror(error));
      break;
    }
    Session& session = sessions.emplace_back();
    session.peer = std::move(peer);
    try {
      session.thread = std::thread([&session, &serial, &server, &mutex, &sessionEnded] {
        ServeObexSession(*session.peer, serial, server);
        session.peer->Interrupt();  // the peer hears at once that it is over
        std::lock_guard<std::mutex> lock(mutex);
        session.done = true;
        sessionEnded.notify_all();
      });
    } catch (const std::system_error&) {
      // No thread to be had: this peer is turned away, the others go on.
      session.peer->Close();
      sessions.pop_back();
    }
  }
  // Sessions still running finish on their own once enough objects have
  // arrived; when stopped (or failing) they are woken and end at once.
  bool interrupted = false;
  for (;;) {
    reap();
    if (sessions.empty()) break;
    if ((stop || !status) && !interrupted) {
      for (Session& session : sessions) session.peer->Interrupt();
      interrupted = true;
    }
    std::unique_lock<std::mutex> lock(mutex);
    sessionEnded.wait_for(lock, std::chrono::milliseconds(options.pollMs));
  }
  return status;
}

Status ReceiveIntoDataFolder(const std::string& dataFolder, UiPort& ui, ReceiveHooks& hooks,
                             const ReceiverOptions& options, const std::atomic<bool>& stop,
                             const std::function<void(const std::string&)>& listening,
                             const std::function<void(const std::string&)>& report) {
  OpenDatabases dbs{{}, nullptr, dataFolder};
  ReceiveStore store(dbs, ui, hooks, report);
  TcpTransport transport({});
  return RunReceiver(transport, store, options, stop, listening);
}

BackgroundReceiver::BackgroundReceiver(StreamTransport& transport, ObjectSink& sink,
                                       ReceiverOptions options)
    : transport_(transport), sink_(sink), options_(std::move(options)) {}

void BackgroundReceiver::Start() {
  if (thread_.joinable()) return;
  stop_ = false;
  thread_ = std::thread([this] { status_ = RunReceiver(transport_, sink_, options_, stop_); });
}

void BackgroundReceiver::Stop() {
  stop_ = true;
  if (thread_.joinable()) thread_.join();
}

}  // namespace cx::obex
