// The keyboard: lock keys with their LEDs, toggled by the press of the key; and the touchpad with its own LED.
#pragma once

#include <array>
#include <string>

#include "platform/Keyboard.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

class KeyboardDevice : public Device {
 public:
  /// Stands for the touchpad's LED among the registers of this device, beside the virtual-key codes.
  static constexpr std::uint64_t kTouchpadLed = 0x100;

  /// A key event; a press of a lock key that is up toggles its LED.
  void Event(std::uint8_t virtualKey, std::uint8_t scanCode, std::uint32_t flags);

  void SetTouchpadLed(bool on) { touchpadLed_ = on; }

  /// Pins "num-lock", "caps-lock", "scroll-lock", "touchpad".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  struct LockKey {
    std::string_view pin;
    std::uint8_t virtualKey = 0;
    std::uint8_t scanCode = 0;
    bool down = false;
    bool lit = false;
  };

  std::array<LockKey, 3> keys_{{{"num-lock", 144, 69}, {"caps-lock", 20, 58}, {"scroll-lock", 145, 70}}};
  bool touchpadLed_ = false;
};

}  // namespace panelglow::platform::sim
