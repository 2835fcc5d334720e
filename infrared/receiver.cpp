#include "infrared/receiver.h"

#include <cerrno>
#include <cstring>

#include "infrared/receive_store.h"
#include "platform/tcp_transport.h"

namespace cx::obex {

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
  int arrived = 0;
  while (!stop && (options.count <= 0 || arrived < options.count)) {
    std::unique_ptr<StreamConnection> peer = listener->Accept(options.pollMs, error);
    if (!peer) {
      if (error == ETIMEDOUT || error == EINTR || error == ECONNABORTED) continue;
      return Status::Error(std::string("Receiving stopped: ") + std::strerror(error));
    }
    arrived += ServeObexSession(*peer, sink, server).delivered;
    peer->Close();
  }
  return Status::Ok();
}

Status ReceiveIntoDataFolder(const std::string& dataFolder, UiPort& ui,
                             const ReceiverOptions& options, const std::atomic<bool>& stop,
                             const std::function<void(const std::string&)>& listening,
                             const std::function<void(const std::string&)>& report) {
  OpenDatabases dbs{{}, nullptr, dataFolder};
  ReceiveHooks hooks;
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
