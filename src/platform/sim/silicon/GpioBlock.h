// A general-purpose I/O block of a Super-I/O's run-time registers: one output latch, and behind it the pin levels.
#pragma once

#include <string>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// Base + 0: output latch (write; reads back what was written). Base + 1: pin levels (read only): latched level of an
/// output pin, the outside level of an input pin. Writes to it are lost.
class GpioBlock : public Device {
 public:
  /// `outputs`: mask of the pins that are outputs; `inputs`: outside level of the other pins.
  GpioBlock(std::uint16_t base, std::uint8_t outputs, std::uint8_t inputs, std::uint8_t latch)
      : base_(base), outputs_(outputs), inputs_(inputs), latch_(latch) {}

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override { return {{base_, 2}}; }
  std::uint8_t ReadPort(std::uint16_t port) override { return port == base_ ? latch_ : Pins(); }
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  /// Pins "0" to "7".
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::uint8_t Pins() const {
    return static_cast<std::uint8_t>((latch_ & outputs_) | (inputs_ & ~outputs_));
  }

  std::uint16_t base_;
  std::uint8_t outputs_;
  std::uint8_t inputs_;
  std::uint8_t latch_;
};

/// The number of a pin named by one digit, 0 to 7.
std::optional<unsigned> PinNumber(std::string_view pin);

}  // namespace panelglow::platform::sim
