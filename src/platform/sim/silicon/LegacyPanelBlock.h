// The front-panel registers of the oldest desktops: two LED configuration registers and a GPIO data register of the
// Super-I/O, and the chipset's GPIO data port with the drive LED.
#pragma once

#include <string>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// Base + 0x33 and + 0x34: configuration of the green and the red power LED, bit 2 set: the Super-I/O drives the LED
/// by itself (green steady on, red off: the machine is awake); clear: the LED follows the data register. Base + 0x4D:
/// data register, bit 0 the red, bit 1 the green power LED; the two share one pair of lines, so both set leaves both
/// dark. Port 0xFA0E: chipset GPIO, bit 7 the red drive LED.
class LegacyPanelBlock : public Device {
 public:
  static constexpr std::uint16_t kChipsetGpioData = 0xFA0E;

  explicit LegacyPanelBlock(std::uint16_t base) : base_(base) {}

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  /// Pins "power-green", "power-red", "drive-red".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  std::uint8_t* Register(std::uint16_t port);

  std::uint16_t base_;
  std::uint8_t greenConfiguration_ = 0x04;
  std::uint8_t redConfiguration_ = 0x04;
  std::uint8_t data_ = 0x02;
  std::uint8_t chipsetGpio_ = 0x00;
};

}  // namespace panelglow::platform::sim
