#include "platform/host_linux/LinuxKeyboard.h"

#include <fcntl.h>
#include <linux/input.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <vector>

#include "platform/host_linux/CurrentThread.h"
#include "platform/posix/Descriptor.h"

namespace panelglow::platform::host_linux {

namespace {

struct LockLed {
  std::uint8_t virtualKey;
  std::uint16_t led;
};
constexpr std::array<LockLed, 3> kLockLeds{{{144, LED_NUML}, {20, LED_CAPSL}, {145, LED_SCROLLL}}};

constexpr std::size_t kLedBytes = LED_MAX / 8 + 1;
using LedBits = std::array<std::uint8_t, kLedBytes>;

bool HasBit(const LedBits& bits, std::uint16_t led) { return (bits[led / 8U] >> (led % 8U) & 1U) != 0; }

std::vector<std::string> EventDevices(const std::string& folder) {
  std::vector<std::string> paths;
  std::error_code none;
  for (std::filesystem::directory_iterator it(folder, none), end; !none && it != end; it.increment(none)) {
    if (it->path().filename().string().rfind("event", 0) == 0) {
      paths.push_back(it->path().string());
    }
  }
  return paths;
}

// 0 when the device's LED is the other way round now; ENODEV when it has none.
int ToggleOn(const std::string& path, std::uint16_t led) {
  const posix::Descriptor device(::open(path.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC));
  if (!device) {
    return errno;
  }
  LedBits owned{};
  LedBits lit{};
  if (::ioctl(device.Get(), EVIOCGBIT(EV_LED, sizeof owned), owned.data()) < 0 || !HasBit(owned, led)) {
    return ENODEV;
  }
  if (::ioctl(device.Get(), EVIOCGLED(sizeof lit), lit.data()) < 0) {
    return errno;
  }
  std::array<input_event, 2> events{};
  events[0].type = EV_LED;
  events[0].code = led;
  events[0].value = HasBit(lit, led) ? 0 : 1;
  events[1].type = EV_SYN;
  events[1].code = SYN_REPORT;
  return ::write(device.Get(), events.data(), sizeof events) == static_cast<ssize_t>(sizeof events) ? 0 : errno;
}

}  // namespace

void LinuxKeyboard::Event(std::uint8_t virtualKey, std::uint8_t /*scanCode*/, std::uint32_t flags) {
  CurrentThread::CheckEndRequest();
  const auto found = std::find_if(kLockLeds.begin(), kLockLeds.end(),
                                  [&](const LockLed& row) { return row.virtualKey == virtualKey; });
  if (found == kLockLeds.end() || (flags & kKeyUp) != 0) {
    return;
  }
  bool isDone = false;
  int refusal = ENODEV;
  for (const std::string& path : EventDevices(folder_)) {
    const int error = ToggleOn(path, found->led);
    isDone = isDone || error == 0;
    refusal = error == 0 || error == ENODEV ? refusal : error;
  }
  if (!isDone) {
    teller_.Tell(refusal == ENODEV
                     ? "No keyboard of this machine has lock-key LEDs that the kernel knows, so they stay dark."
                     : "The lock-key LEDs cannot be reached (" + folder_ + ": " + std::strerror(refusal) +
                           "), so they stay dark" +
                           (refusal == EACCES || refusal == EPERM
                                ? ": start the program as root, or as a member of the group \"input\"."
                                : "."));
  }
}

}  // namespace panelglow::platform::host_linux
