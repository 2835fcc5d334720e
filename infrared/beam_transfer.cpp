#include "infrared/beam_transfer.h"

namespace cx::obex {

BeamTransfer::BeamTransfer(StreamTransport& transport, UiPort& ui, BeamWindows& windows,
                           int replyTimeoutMs)
    : transport_(transport), ui_(ui), windows_(windows), replyTimeoutMs_(replyTimeoutMs) {}

BeamTransfer::~BeamTransfer() {
  GiveUp();
  if (thread_.joinable()) thread_.join();
}

void BeamTransfer::Start(std::vector<HeaderItem> items) {
  if (thread_.joinable()) return;
  items_ = std::move(items);
  thread_ = std::thread([this] {
    ObexLink link{transport_, ui_, windows_, cancel_, abandoned_, replyTimeoutMs_};
    result_ = PutObexInfo(items_, link);
    std::lock_guard<std::mutex> lock(mutex_);
    done_ = true;
    ended_.notify_all();
  });
}

bool BeamTransfer::Wait(std::chrono::milliseconds timeout) {
  std::unique_lock<std::mutex> lock(mutex_);
  if (!thread_.joinable()) return true;
  return ended_.wait_for(lock, timeout, [this] { return done_; });
}

void BeamTransfer::GiveUp() {
  abandoned_ = true;
  cancel_ = true;
}

int RunTransfer(StreamTransport& transport, UiPort& ui, BeamWindows& windows,
                std::vector<HeaderItem> items, std::chrono::milliseconds timeout,
                int replyTimeoutMs) {
  BeamTransfer transfer(transport, ui, windows, replyTimeoutMs);
  transfer.Start(std::move(items));
  if (transfer.Wait(timeout)) return transfer.result();
  transfer.GiveUp();
  return -1;
}

}  // namespace cx::obex
