// A transport inside one process, for tests: listeners are registered by
// name, a connection is a pair of in-memory pipes, and the device search
// and connection can be scripted to fail or find nothing.
#pragma once

#include <deque>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "platform/transport.h"

namespace cx {

class MemoryTransport : public StreamTransport {
 public:
  int Open() override;
  // The registered listeners, by name, unless the script says otherwise.
  int FindDevices(std::vector<std::string>& devices) override;
  std::unique_ptr<StreamConnection> Connect(const std::string& device, int& error) override;
  std::unique_ptr<StreamListener> Listen(const std::string& address, int& error) override;

  // Scripting. All of these may be set from any thread.
  void SetOpenError(int error);
  // The next `count` searches find nothing.
  void HideDevicesFor(int count);
  // Every search fails with this error (0 to stop).
  void SetSearchError(int error);
  // The next connection attempts fail with these errors, in order.
  void FailNextConnects(std::vector<int> errors);
  int searches() const;

  struct Shared;  // the state listeners and connections refer to

 private:
  mutable std::mutex mutex_;
  int openError_ = 0;
  int hiddenSearches_ = 0;
  int searchError_ = 0;
  int searches_ = 0;
  std::deque<int> connectErrors_;
  std::shared_ptr<Shared> shared_ = MakeShared();

  static std::shared_ptr<Shared> MakeShared();
};

}  // namespace cx
