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
#include <iterator>
#include <optional>
#include <utility>
#include <vector>

#include "platform/host_linux/CurrentThread.h"

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

// Whether the device's LED is lit; nothing when it has none, an error number when it has gone.
struct LedState {
  int error = 0;
  std::optional<bool> isLit;
};

LedState StateOf(const posix::Descriptor& device, std::uint16_t led) {
  LedBits owned{};
  LedBits lit{};
  if (::ioctl(device.Get(), EVIOCGBIT(EV_LED, sizeof owned), owned.data()) < 0 ||
      ::ioctl(device.Get(), EVIOCGLED(sizeof lit), lit.data()) < 0) {
    return {errno, {}};
  }
  return {0, HasBit(owned, led) ? std::optional(HasBit(lit, led)) : std::nullopt};
}

int Light(const posix::Descriptor& device, std::uint16_t led, bool isLit) {
  std::array<input_event, 2> events{};
  events[0].type = EV_LED;
  events[0].code = led;
  events[0].value = isLit ? 1 : 0;
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
  const std::lock_guard<std::mutex> lock(guard_);
  const int refusal = OpenNewDevices();
  const bool isBack = !flipped_.insert(found->led).second;
  if (isBack) {
    flipped_.erase(found->led);
  }
  bool isDone = false;
  for (auto entry = devices_.begin(); entry != devices_.end();) {
    const bool isThere = Press(entry->second, found->led, isBack, isDone) == 0;
    entry = isThere ? std::next(entry) : devices_.erase(entry);  // one that came anew is opened with the next press
  }
  if (!isDone) {
    teller_.Tell(refusal == 0 ? "No keyboard of this machine has a LED for this lock key that the kernel knows (" +
                                    folder_ + "; on a text-only system, load the module evdev), so it stays dark."
                              : "The lock-key LEDs cannot be reached (" + folder_ + ": " + std::strerror(refusal) +
                                    "), so they stay dark" +
                                    (refusal == EACCES || refusal == EPERM
                                         ? ": start the program as root, or as a member of the group \"input\"."
                                         : "."));
  }
}

int LinuxKeyboard::Press(Device& device, std::uint16_t led, bool isBack, bool& isDone) {
  const LedState state = StateOf(device.file, led);
  if (!state.isLit) {
    return state.error;
  }
  isDone = true;
  if (!isBack) {
    device.asFound[led] = *state.isLit;
    return Light(device.file, led, !*state.isLit);
  }
  const auto found = device.asFound.find(led);
  if (found == device.asFound.end()) {
    return 0;  // it came after the press that is undone
  }
  const bool wasLit = found->second;
  device.asFound.erase(found);
  return Light(device.file, led, wasLit);
}

int LinuxKeyboard::OpenNewDevices() {
  int refusal = 0;
  for (const std::string& path : EventDevices(folder_)) {
    if (devices_.count(path) != 0) {
      continue;
    }
    posix::Descriptor device(::open(path.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC));
    if (device) {
      devices_.emplace(path, Device{std::move(device), {}});
    } else {
      refusal = errno;
    }
  }
  return refusal;
}

}  // namespace panelglow::platform::host_linux
