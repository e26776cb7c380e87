#include "platform/sim/silicon/FloppyController.h"

#include <array>
#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint8_t kSelected = 0x03;
constexpr std::uint8_t kOutOfReset = 0x04;
constexpr std::uint8_t kTakesCommands = 0x80;
constexpr unsigned kFirstMotorBit = 4;
constexpr std::uint16_t kStatusOffset = 4;

constexpr std::array<std::string_view, 4> kPins{"motor-a", "motor-b", "motor-c", "motor-d"};

}  // namespace

std::vector<AddressRange> FloppyController::PortRanges() const {
  return {{OutputPort(), 1}, {static_cast<std::uint64_t>(base_) + kStatusOffset, 1}};
}

std::uint8_t FloppyController::ReadPort(std::uint16_t port) {
  if (port == OutputPort()) {
    return digitalOutput_;
  }
  return (digitalOutput_ & kOutOfReset) != 0 ? kTakesCommands : std::uint8_t{0};
}

void FloppyController::WritePort(std::uint16_t port, std::uint8_t value) {
  if (port == OutputPort()) {
    digitalOutput_ = value;
  }
}

std::optional<bool> FloppyController::Signal(std::string_view pin) const {
  for (unsigned drive = 0; drive < kPins.size(); ++drive) {
    if (pin == kPins[drive]) {
      return (digitalOutput_ & kOutOfReset) != 0 && (digitalOutput_ & kSelected) == drive &&
             (digitalOutput_ >> (kFirstMotorBit + drive) & 1U) != 0;
    }
  }
  return std::nullopt;
}

std::optional<std::uint64_t> FloppyController::RegisterOf(std::string_view pin) const {
  return Signal(pin) ? std::optional<std::uint64_t>(OutputPort()) : std::nullopt;
}

std::string FloppyController::State() const {
  char text[64];
  std::snprintf(text, sizeof text, "floppy output port %04X = %02X\n", unsigned{OutputPort()},
                unsigned{digitalOutput_});
  return text;
}

}  // namespace panelglow::platform::sim
