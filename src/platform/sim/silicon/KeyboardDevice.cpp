#include "platform/sim/silicon/KeyboardDevice.h"

namespace panelglow::platform::sim {

namespace {
constexpr std::uint64_t kTouchpadRegister = KeyboardDevice::kTouchpadLed;
}  // namespace

void KeyboardDevice::Event(std::uint8_t virtualKey, std::uint8_t scanCode, std::uint32_t flags) {
  for (LockKey& key : keys_) {
    if (key.virtualKey != virtualKey || key.scanCode != scanCode) {
      continue;
    }
    const bool press = (flags & Keyboard::kKeyUp) == 0;
    if (press && !key.down) {
      key.lit = !key.lit;
    }
    key.down = press;
  }
}

std::optional<bool> KeyboardDevice::Signal(std::string_view pin) const {
  if (pin == "touchpad") {
    return touchpadLed_;
  }
  for (const LockKey& key : keys_) {
    if (key.pin == pin) {
      return key.lit;
    }
  }
  return std::nullopt;
}

std::optional<std::uint64_t> KeyboardDevice::RegisterOf(std::string_view pin) const {
  if (pin == "touchpad") {
    return kTouchpadRegister;
  }
  for (const LockKey& key : keys_) {
    if (key.pin == pin) {
      return key.virtualKey;
    }
  }
  return std::nullopt;
}

std::string KeyboardDevice::State() const {
  std::string text;
  for (const LockKey& key : keys_) {
    text += "key " + std::string(key.pin) + (key.lit ? " = lit" : " = dark") + (key.down ? ", held down\n" : "\n");
  }
  return text + (touchpadLed_ ? "touchpad = lit\n" : "touchpad = dark\n");
}

}  // namespace panelglow::platform::sim
