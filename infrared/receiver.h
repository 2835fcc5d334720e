// The receiving side as a whole: listen, serve several peers at once and
// hand what arrives to a sink (normally a ReceiveStore), one object at a
// time.
#pragma once

#include <atomic>
#include <functional>
#include <string>
#include <thread>

#include "engine/receive.h"
#include "infrared/beam_commands.h"
#include "infrared/obex_server.h"
#include "platform/status.h"
#include "platform/transport.h"
#include "platform/ui_port.h"

namespace cx::obex {

struct ReceiverOptions {
  std::string address = kDefaultReceiveAddress;
  // Stop once this many objects have arrived whole (0: until stopped).
  int count = 0;
  ServerOptions server;
  // How often the stop flag is looked at while no peer is connecting.
  int pollMs = 200;
  // Peers served at the same time; more wait until one of them is done, so
  // a peer that connects and then does nothing holds one place only.
  int maxSessions = 4;
};

// Listens at `options.address` and serves up to `options.maxSessions` peers
// at a time, each on a thread of its own, until `options.count` objects have
// arrived (the sessions under way then finish) or `stop` is set (they are
// ended at once). The sink is called from those threads, never two calls
// at once. `listening` hears the address actually listened on once that
// succeeded. An error when the address cannot be listened on.
Status RunReceiver(StreamTransport& transport, ObjectSink& sink, const ReceiverOptions& options,
                   const std::atomic<bool>& stop,
                   const std::function<void(const std::string&)>& listening = nullptr);

// The `receive` command: listens over TCP at `options.address` and stores
// or inserts what arrives in `dataFolder` (no database open), asking
// through `ui` and checking access through `hooks`. `report` hears one line
// per object.
Status ReceiveIntoDataFolder(const std::string& dataFolder, UiPort& ui, ReceiveHooks& hooks,
                             const ReceiverOptions& options, const std::atomic<bool>& stop,
                             const std::function<void(const std::string&)>& listening,
                             const std::function<void(const std::string&)>& report);

// The program's listening thread: started at start-up, stopped when the
// program ends. The sink is called on the session threads, one call at a
// time.
class BackgroundReceiver {
 public:
  BackgroundReceiver(StreamTransport& transport, ObjectSink& sink, ReceiverOptions options);
  ~BackgroundReceiver() { Stop(); }
  BackgroundReceiver(const BackgroundReceiver&) = delete;
  BackgroundReceiver& operator=(const BackgroundReceiver&) = delete;

  void Start();
  // Ends the sessions in progress and waits for the threads (bounded by
  // the poll interval and the stop slices of the packet reader).
  void Stop();
  // What RunReceiver returned, once the thread has ended.
  const Status& status() const { return status_; }

 private:
  StreamTransport& transport_;
  ObjectSink& sink_;
  ReceiverOptions options_;
  std::atomic<bool> stop_{false};
  Status status_;
  std::thread thread_;
};

}  // namespace cx::obex
