#include "platform/sim/silicon/GpioBlock.h"

#include <cstdio>

namespace panelglow::platform::sim {

std::optional<unsigned> PinNumber(std::string_view pin) {
  if (pin.size() != 1 || pin[0] < '0' || pin[0] > '7') {
    return std::nullopt;
  }
  return static_cast<unsigned>(pin[0] - '0');
}

void GpioBlock::WritePort(std::uint16_t port, std::uint8_t value) {
  if (port == base_) {
    latch_ = value;
  }
}

std::optional<bool> GpioBlock::Signal(std::string_view pin) const {
  const std::optional<unsigned> number = PinNumber(pin);
  return number ? std::optional<bool>(((Pins() >> *number) & 1U) != 0) : std::nullopt;
}

std::optional<std::uint64_t> GpioBlock::RegisterOf(std::string_view pin) const {
  return PinNumber(pin) ? std::optional<std::uint64_t>(base_) : std::nullopt;
}

std::string GpioBlock::State() const {
  char text[32];
  std::snprintf(text, sizeof text, "port %04X = %02X\n", base_, latch_);
  return text;
}

}  // namespace panelglow::platform::sim
