// A Super-I/O of the ITE kind: multi-function pins, and two LED blinkers that can be mapped to any GPIO line.
#pragma once

#include <string_view>

#include "platform/sim/silicon/SuperIo.h"

namespace panelglow::platform::sim {

/// Configuration mode ends by writing bit 1 of register 2.
///
/// Set n of lines (10 to 17 is set 1) has a function register 0x24 + n (bit set: the pin is a GPIO line), which any
/// device can read but only device 7 can write; and in device 7 a polarity register 0xB0 + n - 1 (bit set: inverted),
/// a simple-I/O register 0xC0 + n - 1 (bit set: the line follows its level port, clear: its alternate function) and
/// an output register 0xC8 + n - 1 (bit set: output). The blinkers are registers 0xF8 and 0xFA, location of the line
/// (eight times its set plus its bit, 0: none), and 0xF9 and 0xFB, control: bits 2 and 1 the rate (4 Hz, 1 Hz, 1/4
/// Hz, 1/8 Hz), bit 0 holds the line low instead. A blinker drives its line when that is an output with its alternate
/// function. The shorter low part of bit 3 is not modelled.
class IteSuperIo : public SuperIo {
 public:
  using SuperIo::SuperIo;

  [[nodiscard]] std::optional<Microseconds> NextEvent() const override;

 protected:
  [[nodiscard]] std::uint8_t ReadRegister(std::uint8_t address) const override;
  void WriteRegister(std::uint8_t address, std::uint8_t value) override;
  [[nodiscard]] bool LineLevel(std::size_t set, unsigned bit) const override;
  // The GPIO device has no activation register.
  [[nodiscard]] bool IsActive(std::uint8_t device) const override {
    return device == Setup().gpioDevice || SuperIo::IsActive(device);
  }

 private:
  [[nodiscard]] bool LineBit(std::uint8_t firstRegister, std::size_t set, unsigned bit) const;
  [[nodiscard]] bool BlinkerLevel(std::size_t set, unsigned bit) const;
};

}  // namespace panelglow::platform::sim
