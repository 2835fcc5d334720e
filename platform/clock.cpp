#include "platform/clock.h"

#include <ctime>

namespace cx {

int64_t SystemClock::Now() const { return static_cast<int64_t>(std::time(nullptr)); }

bool SystemClock::DaylightSaving() const {
  std::time_t now = std::time(nullptr);
  std::tm local{};
  localtime_r(&now, &local);
  return local.tm_isdst > 0;
}

const Clock& DefaultClock() {
  static const SystemClock clock;
  return clock;
}

}  // namespace cx
