// Wall-clock time as the file header stores it, behind an interface so that
// tests can fix it.
#pragma once

#include <cstdint>

namespace cx {

class Clock {
 public:
  virtual ~Clock() = default;
  // Seconds since 1 January 1970 (UTC).
  virtual int64_t Now() const = 0;
  // True while daylight-saving time is in effect in the local time zone.
  virtual bool DaylightSaving() const = 0;
};

class SystemClock : public Clock {
 public:
  int64_t Now() const override;
  bool DaylightSaving() const override;
};

class FixedClock : public Clock {
 public:
  explicit FixedClock(int64_t now, bool dst = false) : now_(now), dst_(dst) {}
  int64_t Now() const override { return now_; }
  bool DaylightSaving() const override { return dst_; }

 private:
  int64_t now_;
  bool dst_;
};

// The process-wide system clock (stateless, so sharing it is harmless).
const Clock& DefaultClock();

}  // namespace cx
