// The machine's clock: virtual time.
#pragma once

#include <cstdint>
#include <ctime>

#include "platform/Clock.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimClock : public Clock {
 public:
  SimClock(Scheduler& scheduler, std::time_t start) : scheduler_(scheduler), start_(start) {}
  std::uint32_t TickCount() override {
    scheduler_.Spend(1);  // so that a loop that only reads the clock comes to its end
    return static_cast<std::uint32_t>(scheduler_.Now() / 1000 + kBootTicks);
  }
  std::time_t WallTime() override { return start_ + static_cast<std::time_t>(scheduler_.Now() / 1'000'000); }
  std::tm LocalTime(std::time_t seconds) override {
    std::tm parts{};
    gmtime_r(&seconds, &parts);  // a simulated machine stands at Greenwich
    return parts;
  }
  void Sleep(std::uint32_t milliseconds) override { scheduler_.SleepFor(Microseconds{milliseconds} * 1000); }

 private:
  static constexpr std::uint64_t kBootTicks = 0xFFFFD8F0;  // 10 s before the counter wraps
  Scheduler& scheduler_;
  std::time_t start_;
};

}  // namespace panelglow::platform::sim
