#include "board/Saddle.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kGreen = 0x40;  // of the register of the multi-function pins
constexpr std::uint8_t kDark = 0x00;

}  // namespace

bool Saddle::SavePowerLedState() {
  OpenAndKeep();
  return true;
}

bool Saddle::AssertPowerLedGreen() {
  superIo.Write(kPinRegister, kGreen);
  return true;
}

bool Saddle::DeassertPowerLed() {
  superIo.Write(kPinRegister, kDark);
  return true;
}

}  // namespace panelglow
