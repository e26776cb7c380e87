#include "board/Lantern.h"

#include <array>
#include <utility>

namespace panelglow {

namespace {

constexpr std::array<std::uint8_t, 2> kEnterKeys{0x87, 0x87};
constexpr std::array<std::uint8_t, 1> kExitKeys{0xAA};

// The LED's pin in the register of the multi-function pins. It is written to this port in every model.
constexpr std::uint16_t kPinPort = 0x2F;
constexpr std::uint8_t kNotForLed = 0x02;
constexpr std::uint8_t kForLed = 0x05;

// Hardware monitor: a mode for all fans, and their duties.
constexpr std::int64_t kFanDivisor = 1'500'000;
constexpr RegisterId kFanMode{0, 0x96};
constexpr std::uint8_t kAllManual = 0xFF;

FanTable Fans() {
  return {.tachOverflow = 0x0FFF,  // 12 bits
          .duties = RegistersAt(0, {0xA3, 0xB3, 0xC3}),
          .fullSpeed = 0xFF,
          .saved = {kFanMode},
          .manual = {Put(kFanMode, kAllManual)}};
}

}  // namespace

Lantern::Lantern(std::string boardClass, std::uint16_t boardId, std::uint16_t indexPort)
    : OldestBoard(std::move(boardClass), boardId,
                  {.indexPort = indexPort, .fanLatched = false, .fanDivisor = kFanDivisor, .fans = Fans()}),
      button(devio, Settings().powerIoBase, PowerEventButton::Check::kNone) {}

std::uint8_t Lantern::OpenAndKeep() {
  isOpen = true;
  superIo.Send(kEnterKeys);
  const std::uint8_t pins = superIo.Read(kPinRegister);
  savedPins = savedPins.value_or(pins);
  return pins;
}

bool Lantern::SavePowerLedState() {
  const std::uint8_t pins = OpenAndKeep();
  devio.OutportByte(kPinPort, static_cast<std::uint8_t>((pins & ~kNotForLed) | kForLed));
  return true;
}

bool Lantern::RestorePowerLedState() {
  if (!isOpen) {
    return true;
  }
  if (savedPins) {
    superIo.Write(kPinRegister, *savedPins);
  }
  superIo.Send(kExitKeys);
  savedPins.reset();
  isOpen = false;
  return true;
}

bool Lantern::SavePowerButton() {
  if (!button.HasBase()) {
    return false;
  }
  button.Save();
  return true;
}
bool Lantern::RestorePowerButton() { return button.HasBase() && button.Restore(); }
bool Lantern::ArmPowerButton() { return button.HasBase() && button.Arm(); }
bool Lantern::IsPowerButtonPressed(bool& pressed) {
  pressed = button.HasBase() && button.IsPressed();
  return button.HasBase();
}

}  // namespace panelglow
