// Synthetic key events, as the lock-key LEDs need them.
#pragma once

#include <cstdint>

namespace panelglow::platform {

class Keyboard {
 public:
  static constexpr std::uint32_t kExtendedKey = 1;
  static constexpr std::uint32_t kKeyUp = 2;

  virtual ~Keyboard() = default;

  /// One press (without kKeyUp in `flags`) or release of a key, by virtual-key and scan code.
  virtual void Event(std::uint8_t virtual_key, std::uint8_t scan_code, std::uint32_t flags) = 0;
};

}  // namespace panelglow::platform
