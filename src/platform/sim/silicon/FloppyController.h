// A floppy-disk controller, as far as its drives' motors go.
#pragma once

#include <string>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

struct FloppyControllerSetup {
  std::uint16_t base = 0x3F0;
  std::uint8_t digitalOutput = 0;  // at the start: as after power-on, in reset
};

/// Base + 2: digital output register, bits 0 and 1 the drive that is selected, bit 2 clear: the controller is held in
/// reset, bit 3 the DMA gate, bits 4 to 7 the motors of drives A to D. A drive's lamp is lit while it is selected,
/// its motor runs and the controller is out of reset. Base + 4: main status register, bit 7 set when the controller
/// takes commands.
class FloppyController : public Device {
 public:
  explicit FloppyController(const FloppyControllerSetup& setup)
      : base_(setup.base), digitalOutput_(setup.digitalOutput) {}

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  /// Pins "motor-a" to "motor-d".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::uint16_t OutputPort() const { return static_cast<std::uint16_t>(base_ + 2); }

  std::uint16_t base_;
  std::uint8_t digitalOutput_;
};

}  // namespace panelglow::platform::sim
