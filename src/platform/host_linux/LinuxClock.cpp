#include "platform/host_linux/LinuxClock.h"

#include <chrono>

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

std::uint32_t LinuxClock::TickCount() {
  CurrentThread::CheckEndRequest();
  const auto sinceBoot = std::chrono::steady_clock::now().time_since_epoch();
  return static_cast<std::uint32_t>(std::chrono::duration_cast<std::chrono::milliseconds>(sinceBoot).count());
}

std::time_t LinuxClock::WallTime() { return std::time(nullptr); }

std::tm LinuxClock::LocalTime(std::time_t seconds) {
  std::tm parts{};
  ::localtime_r(&seconds, &parts);
  return parts;
}

void LinuxClock::Sleep(std::uint32_t milliseconds) {
  CurrentThread::SleepFor(std::chrono::milliseconds(milliseconds));
}

}  // namespace panelglow::platform::host_linux
