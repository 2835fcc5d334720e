// A transfer runs on a thread of its own; the user-interface thread keeps
// the device-search and progress windows and waits for the thread to end,
// giving up after a time-out.
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <vector>

#include "infrared/obex_client.h"

namespace cx::obex {

class BeamTransfer {
 public:
  // The transport, the port and the windows must outlive the transfer.
  BeamTransfer(StreamTransport& transport, UiPort& ui, BeamWindows& windows,
               int replyTimeoutMs = 30000);
  // Gives up on a transfer still running and waits for its thread.
  ~BeamTransfer();
  BeamTransfer(const BeamTransfer&) = delete;
  BeamTransfer& operator=(const BeamTransfer&) = delete;

  // Starts the sending thread on its own copy of the object. Once only.
  void Start(std::vector<HeaderItem> items);

  // The device-search window's cancel button.
  void Cancel() { cancel_ = true; }

  // Waits at most `timeout`; true when the transfer has ended.
  bool Wait(std::chrono::milliseconds timeout);

  // Stops waiting for good: the transfer ends at its next packet or poll
  // and shows nothing more.
  void GiveUp();

  // PutObexInfo's answer once Wait returned true.
  int result() const { return result_; }

 private:
  StreamTransport& transport_;
  UiPort& ui_;
  BeamWindows& windows_;
  int replyTimeoutMs_;
  std::vector<HeaderItem> items_;
  std::atomic<bool> cancel_{false};
  std::atomic<bool> abandoned_{false};
  std::mutex mutex_;
  std::condition_variable ended_;
  bool done_ = false;
  std::atomic<int> result_{0};
  std::thread thread_;
};

// Starts a transfer and waits for it as the user-interface thread does:
// PutObexInfo's answer, or -1 when `timeout` passed first (the transfer is
// then given up and its thread finished before returning).
int RunTransfer(StreamTransport& transport, UiPort& ui, BeamWindows& windows,
                std::vector<HeaderItem> items, std::chrono::milliseconds timeout,
                int replyTimeoutMs = 30000);

}  // namespace cx::obex
