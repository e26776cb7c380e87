// The system's monotonic clock and its wall clock.
#pragma once

#include "platform/Clock.h"

namespace panelglow::platform::host_linux {

class LinuxClock : public Clock {
 public:
  std::uint32_t TickCount() override;
  std::time_t WallTime() override;
  std::tm LocalTime(std::time_t seconds) override;
  void Sleep(std::uint32_t milliseconds) override;
};

}  // namespace panelglow::platform::host_linux
