#include "board/chips/Chip.h"

#include "board/base/BoardDevio.h"
#include "board/parts/RpmOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::int64_t kTachClock = 5'400'000;  // counts per minute of the tachometers' clock
constexpr int kFullDuty = 255;

constexpr PowerButtonPorts kPowerButton{.control = 0x458, .enable = 0xF802, .status = 0xF801};

// Index and data of the second bank of clock memory, touched after a latched status is cleared.
constexpr std::uint16_t kClockBankIndex = 0x72;
constexpr std::uint16_t kClockBankData = 0x73;
constexpr std::uint8_t kClockBankRegister = 0xAA;

constexpr std::uint32_t kLatchSettle_ms = 250;

}  // namespace

Chip::Chip() : Chip("chip") {}

Chip::Chip(std::string chipName) : devio(BoardDevio()), name(std::move(chipName)), powerButton(devio, kPowerButton) {}

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

int Chip::TachToRpm(std::uint32_t raw, int multiplier) { return RpmOf(multiplier * kTachClock, raw); }

bool Chip::SetFanPwmPercent(int fan, int percent) {
  return SetFanPwm(fan, static_cast<int>(std::int64_t{percent} * kFullDuty / 100));
}

bool Chip::ReadConfigBit(std::uint8_t /*ldn*/, std::uint8_t /*reg*/, int /*bit*/, bool& /*value*/) {
  platform::TheHost().console.Write("BASIC\n");
  return false;
}

// ---- power button

bool Chip::SavePowerButtonState() {
  powerButton.Save();
  return true;
}

bool Chip::ArmPowerButton() {
  powerButton.Arm();
  return true;
}

bool Chip::IsPowerButtonPressed(bool& pressed) {
  pressed = powerButton.IsPressed();
  return true;
}

bool Chip::RestorePowerButtonState() {
  powerButton.Restore();
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
