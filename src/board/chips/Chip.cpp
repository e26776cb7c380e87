#include "board/chips/Chip.h"

#include "board/base/BoardDevio.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kTachClock = 5'400'000;           // counts per minute of the tachometers' clock
constexpr std::uint32_t kTachStopped = 0xFFFF;  // a tachometer that has run over: the fan stands
constexpr int kFullDuty = 255;

// Power button registers of the chipset.
constexpr std::uint16_t kPowerButtonControl = 0x458;
constexpr std::uint16_t kPowerEventMask = 0xF802;
constexpr std::uint16_t kPowerEventStatus = 0xF801;

// Index and data of the second bank of clock memory, touched after a latched status is cleared.
constexpr std::uint16_t kClockBankIndex = 0x72;
constexpr std::uint16_t kClockBankData = 0x73;
constexpr std::uint8_t kClockBankRegister = 0xAA;

constexpr std::uint32_t kLatchSettle_ms = 250;

}  // namespace

Chip::Chip() : Chip("chip") {}

Chip::Chip(std::string chipName) : devio(BoardDevio()), name(std::move(chipName)) {}

// ---- fans

bool Chip::ReadFanRpm(int fan, int& rpm, int multiplier) {
  const std::uint32_t raw = ReadFanTach(fan, 0);
  rpm = 0;
  if (raw == 0 || raw == kTachStopped) {
    return false;
  }
  rpm = TachToRpm(raw, multiplier);
  return true;
}

bool Chip::ReadFanRpmRaw(int fan, int& rpm, int multiplier) {
  rpm = TachToRpm(ReadFanTach(fan, 0), multiplier);
  return true;
}

int Chip::TachToRpm(std::uint32_t raw, int multiplier) {
  if (raw == 0 || raw == kTachStopped) {
    return 0;
  }
  return static_cast<int>(std::int64_t{multiplier} * kTachClock / std::int64_t{raw});
}

bool Chip::SetFanPwmPercent(int fan, int percent) { return SetFanPwm(fan, percent * kFullDuty / 100); }

bool Chip::ReadConfigBit(std::uint8_t /*ldn*/, std::uint8_t /*reg*/, int /*bit*/, bool& /*value*/) {
  platform::TheHost().console.Write("BASIC\n");
  return false;
}

// ---- power button

bool Chip::SavePowerButtonState() {
  powerButtonPort = devio.InportByte(kPowerButtonControl);
  return true;
}

bool Chip::ArmPowerButton() {
  devio.OutportByte(kPowerButtonControl, static_cast<std::uint8_t>((powerButtonPort & ~2U) | 1U));
  powerButtonMask = devio.InportWord(kPowerEventMask);
  devio.OutportWord(kPowerEventMask, 0);
  devio.OutportByte(kPowerEventStatus, 1);
  return true;
}

bool Chip::IsPowerButtonPressed(bool& pressed) {
  pressed = (devio.InportByte(kPowerEventStatus) & 1U) != 0;
  return true;
}

bool Chip::RestorePowerButtonState() {
  devio.OutportByte(kPowerEventStatus, 1);
  devio.OutportWord(kPowerEventMask, powerButtonMask);
  devio.OutportByte(kPowerButtonControl, powerButtonPort);
  return true;
}

// ---- latched status ports

bool Chip::ReadLatchedPort(std::uint16_t port, std::uint32_t mask, bool& value) {
  const std::uint8_t status = devio.InportByte(port);
  value = (status & mask) != 0;
  if (value) {
    devio.OutportByte(port, status);
  }
  return true;
}

bool Chip::ReadLatchedPortDword(std::uint16_t port, std::uint32_t mask, bool& value) {
  lastStatus = devio.InportDword(port);
  value = (lastStatus & mask) != 0;
  if (value) {
    platform::TheHost().clock.Sleep(kLatchSettle_ms);
    ClearLatchedPortDword(port, mask);
  }
  return true;
}

bool Chip::ClearLatchedPortDword(std::uint16_t port, std::uint32_t /*mask*/) {
  devio.OutportDword(port, devio.InportDword(port));
  devio.OutportByte(kClockBankIndex, kClockBankRegister);
  devio.OutportByte(kClockBankData, 0);
  return true;
}

}  // namespace panelglow
