#include "board/chips/southbridge/DashController.h"

#include <array>
#include <cstddef>
#include <vector>

#include "board/parts/ConfigMode.h"
#include "board/parts/Lines.h"
#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kMemoryBar = 0x18;
constexpr std::uint64_t kBarFlags = 15;
constexpr std::uint64_t kPinControl = 0xB8;
constexpr std::uint32_t kOutputEnabled = 0x80000;
constexpr std::uint32_t kOutputHigh = 0x800;
constexpr std::int64_t kLargestId = 0xFFFF;
constexpr std::uint32_t kPinSettle_ms = 10;

using Dword = std::array<std::byte, 4>;

}  // namespace

std::optional<DashController> DashController::Find(CDevio& client, const std::string& idList) {
  std::vector<std::string> tokens;
  CDMUtil::Split(idList, tokens, " ");
  std::array<std::uint16_t, 4> ids{};
  if (tokens.size() != ids.size()) {
    return std::nullopt;
  }
  for (std::size_t i = 0; i < ids.size(); ++i) {
    const std::int64_t id = CDMUtil::IsInteger(tokens[i]) ? CDMUtil::ToInt64(tokens[i]) : -1;
    if (id < 0 || id > kLargestId) {
      return std::nullopt;
    }
    ids[i] = static_cast<std::uint16_t>(id);
  }
  std::uint16_t location = 0;
  return client.FindPciDeviceByIds(kNetworkClass, ids[0], ids[1], ids[2], ids[3], location) ? At(client, location)
                                                                                            : std::nullopt;
}

std::optional<DashController> DashController::At(CDevio& client, std::uint16_t location) {
  std::uint64_t base = 0;
  if (client.ReadPciBar(location, kMemoryBar, base) != 0 || (base & ~kBarFlags) == 0) {
    return std::nullopt;
  }
  return DashController(client, base & ~kBarFlags);
}

// The pin driven low, and high behind it whatever was seen; for the life of a ConfigMode.
class DashController::LowPin {
 public:
  LowPin(const DashController& of, DashWatcher& by) : controller(of), watcher(by) {}
  void EnterConfigMode() { isDriven = controller.SetOutput(false, watcher); }
  void ExitConfigMode() { isDriven = controller.SetOutput(true, watcher); }

  /// Whether the last change reached the controller.
  [[nodiscard]] bool IsDriven() const { return isDriven; }

 private:
  const DashController& controller;
  DashWatcher& watcher;
  bool isDriven = false;
};

std::optional<bool> DashController::LineFollows(const std::function<int()>& readLine, DashWatcher& watcher) const {
  bool isRead = true;
  const auto sees = [&](bool high) {
    platform::TheHost().clock.Sleep(kPinSettle_ms);
    const int state = readLine();
    isRead = isRead && state != kNoSuchLineState;
    const bool follows = state == LineState(high);
    watcher.See(high, follows);
    return follows;
  };
  if (!Change(0, kOutputEnabled, watcher)) {
    return std::nullopt;
  }
  LowPin pin(*this, watcher);
  bool followsLow = false;
  {
    const ConfigMode low(pin);
    if (!pin.IsDriven()) {
      return std::nullopt;
    }
    followsLow = sees(false);
  }
  if (!pin.IsDriven()) {
    return std::nullopt;
  }
  const bool followsHigh = sees(true);
  return isRead ? std::optional(followsLow && followsHigh) : std::nullopt;
}

bool DashController::Change(std::uint32_t clear, std::uint32_t set, DashWatcher& watcher) const {
  const std::uint64_t pins = base + kPinControl;
  const auto low = static_cast<std::uint32_t>(pins);
  const auto high = static_cast<std::uint32_t>(pins >> 32U);
  Dword bytes{};
  const std::uint32_t read = devio->ReadPhysicalMemory64(low, high, sizeof bytes, bytes);
  std::uint32_t value = 0;
  for (std::size_t i = bytes.size(); i-- > 0;) {
    value = value << 8U | std::to_integer<std::uint32_t>(bytes[i]);
  }
  watcher.Read(pins, value, read);
  if (read == 0) {
    return false;
  }
  value = (value & ~clear) | set;
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    bytes[i] = static_cast<std::byte>(value >> (8 * i));
  }
  watcher.Write(pins, value);
  // A base below 4 GB is all that a 32-bit system has, and the wide request is not for it.
  return (high == 0 ? devio->WritePhysicalMemory(low, sizeof bytes, bytes)
                    : devio->WritePhysicalMemory64(low, high, sizeof bytes, bytes)) != 0;
}

bool DashController::SetOutput(bool high, DashWatcher& watcher) const {
  return Change(high ? 0 : kOutputHigh, high ? kOutputHigh : 0, watcher);
}

}  // namespace panelglow
