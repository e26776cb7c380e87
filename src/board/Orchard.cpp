#include "board/Orchard.h"

#include <array>
#include <utility>

namespace panelglow {

namespace {

constexpr std::uint16_t kIndexPort = 0x2E;
constexpr PowerButtonPorts kPowerButton{.control = 0x458, .enable = 0xF802, .status = 0xF801};

constexpr std::uint16_t kLedPort = 0x420;
constexpr std::uint8_t kGreen = 0x40;
constexpr std::uint8_t kRed = 0x10;
constexpr std::uint8_t kDark = 0x00;

// Super-I/O registers: pin multiplexer, logical device, and of that device the line that is set up and how.
constexpr std::uint8_t kPinMultiplexer = 0x25;
constexpr std::uint8_t kPinsAreGpio = 0x58;
constexpr std::uint8_t kPinsAtStart = 0x40;
constexpr std::array<std::pair<std::uint8_t, std::uint8_t>, 6> kGpioSetUp{
    {{kPinMultiplexer, kPinsAreGpio}, {0x07, 0x07}, {0xF0, 0x04}, {0xF1, 0x03}, {0xF0, 0x06}, {0xF1, 0x03}}};

}  // namespace

Orchard::Orchard(std::uint16_t boardId)
    : OldestBoard("Orchard", boardId, {.indexPort = kIndexPort, .fanLatched = true}), button(devio, kPowerButton) {}

bool Orchard::SavePowerLedState() {
  isSaved = true;
  for (const auto& [reg, value] : kGpioSetUp) {
    superIo.Write(reg, value);
  }
  return true;
}

bool Orchard::Light(std::uint8_t lines) {
  devio.OutportByte(kLedPort, lines);
  return true;
}

bool Orchard::AssertPowerLedGreen() { return Light(kGreen); }
bool Orchard::AssertPowerLedRed() { return Light(kRed); }
bool Orchard::DeassertPowerLed() { return Light(kDark); }

bool Orchard::RestorePowerLedState() {
  if (!isSaved) {
    return false;
  }
  Light(kGreen);
  superIo.Write(kPinMultiplexer, kPinsAtStart);
  isSaved = false;  // last: a restore that is interrupted is done again
  return true;
}

bool Orchard::SavePowerButton() {
  button.Save();
  return true;
}
bool Orchard::RestorePowerButton() {
  button.Restore();
  return true;
}
bool Orchard::ArmPowerButton() {
  button.Arm();
  return true;
}
bool Orchard::IsPowerButtonPressed(bool& pressed) {
  pressed = button.IsPressed();
  return true;
}

}  // namespace panelglow
