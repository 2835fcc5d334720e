#include "platform/run_beside.h"

#include <system_error>
#include <thread>

namespace cx {

void RunBeside(const std::function<void()>& aside, const std::function<void()>& here) {
  std::thread helper;
  try {
    helper = std::thread(aside);
  } catch (const std::system_error&) {
    here();
    aside();
    return;
  }
  here();
  helper.join();
}

}  // namespace cx
