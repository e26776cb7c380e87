// A Super-I/O of the Fintek kind: GPIO lines in configuration registers, and two LED pins with a mode register each.
#pragma once

#include <string_view>

#include "platform/sim/silicon/SuperIo.h"

namespace panelglow::platform::sim {

/// The GPIO device has for each set of lines an output-enable register, an output register and a read-only register
/// with the pin levels: 0xF0 to 0xF2 for lines 0 to 7, 0xE0 to 0xE2 for 10 to 17, and so on down to 0xB0 for 40
/// to 47. Device 0x0A has the modes of the LED pins, "LED_VCC" at 0xF8 and "LED_VSB" at 0xF9. Bits 1 and 0 apply to a
/// machine that is awake: held low, released (a resistor on the board pulls it high), 0.5 Hz, 1 Hz. The bits above
/// belong to the sleeping states.
class FintekSuperIo : public SuperIo {
 public:
  using SuperIo::SuperIo;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;

 protected:
  [[nodiscard]] std::uint8_t ReadRegister(std::uint8_t address) const override;
  void WriteRegister(std::uint8_t address, std::uint8_t value) override;
  [[nodiscard]] bool LineLevel(std::size_t set, unsigned bit) const override;
  [[nodiscard]] std::size_t FirstSet() const override { return 0; }
  [[nodiscard]] bool HasLevelPorts() const override { return false; }
};

}  // namespace panelglow::platform::sim
