// InitIrSock: the device search and the connection to the first device.
#include <cerrno>
#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "infrared/obex_client.h"
#include "infrared/obex_messages.h"

namespace cx::obex {
namespace {

constexpr char kRoutine[] = "InitIrSock";

void Fail(ObexLink& link, const char* format, int error) {
  link.windows.CloseDeviceSearch();
  if (!link.abandoned) link.ui.ShowMessage(RoutineMessage(format, kRoutine, error), kCaptionError);
}

}  // namespace

std::unique_ptr<StreamConnection> InitIrSock(ObexLink& link) {
  if (int error = link.transport.Open(); error != 0) {
    if (!link.abandoned) {
      link.ui.ShowMessage(RoutineMessage(kMsgSocketFailed, kRoutine, error), kCaptionError);
    }
    return nullptr;
  }
  link.windows.ShowDeviceSearch();
  for (;;) {
    std::vector<std::string> devices;
    while (devices.empty()) {
      if (link.cancel || link.abandoned) {
        link.windows.CloseDeviceSearch();
        return nullptr;
      }
      if (int error = link.transport.FindDevices(devices); error != 0) {
        Fail(link, kMsgSearchFailed, error);
        return nullptr;
      }
      std::this_thread::sleep_for(std::chrono::milliseconds(link.pollIntervalMs));
    }
    int error = 0;
    if (auto connection = link.transport.Connect(devices.front(), error)) return connection;
    if (error != ECONNABORTED) {
      Fail(link, kMsgConnectFailed, error);
      return nullptr;
    }
  }
}

}  // namespace cx::obex
