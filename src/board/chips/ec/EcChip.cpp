#include "board/chips/ec/EcChip.h"

#include "board/parts/Bits.h"
#include "board/parts/RowOf.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kStatusPort = 0x66;  // status when read, command when written
constexpr std::uint16_t kDataPort = 0x62;
constexpr std::uint8_t kOutputBufferFull = 0x01;
constexpr std::uint8_t kInputBufferFull = 0x02;
constexpr int kMostLooks = 4096;

constexpr std::uint8_t kReadCommand = 0x80;
constexpr std::uint8_t kWriteWordCommand = 0xC1;
constexpr std::uint8_t kLedModeCommand = 0x8E;
constexpr std::uint8_t kLedControlCommand = 0xEE;

// Tachometers: low and high byte's addresses, fan 1 and fan 2.
constexpr std::uint8_t kTachAddresses[2][2] = {{0x66, 0x67}, {0x68, 0x69}};
constexpr std::uint16_t kFanControl = 0x0461;
constexpr std::uint8_t kAutomatic = 0;
constexpr std::uint8_t kManual = 4;
constexpr std::uint16_t kDuty[2] = {0x0457, 0x04DE};
constexpr std::uint8_t kTemperature = 0x58;

constexpr std::uint32_t kNoTach = 0xFFFF;
constexpr int kNoTemperature = 255;
constexpr double kTachPeriod_s = 2.7826087e-5;

}  // namespace

void EcChip::WaitIbfClear() {
  for (int look = 0; look < kMostLooks && (devio.InportByte(kStatusPort) & kInputBufferFull) != 0; ++look) {
  }
}

void EcChip::WaitObfSet() {
  for (int look = 0; look < kMostLooks && (devio.InportByte(kStatusPort) & kOutputBufferFull) == 0; ++look) {
  }
}

void EcChip::Send(std::uint8_t command, std::initializer_list<std::uint8_t> data) {
  WaitIbfClear();
  devio.OutportByte(kStatusPort, command);
  for (const std::uint8_t byte : data) {
    WaitIbfClear();
    devio.OutportByte(kDataPort, byte);
  }
}

std::uint8_t EcChip::TakeOutput() { return devio.InportByte(kDataPort); }

std::uint8_t EcChip::ReadEc(std::uint8_t address) {
  Send(kReadCommand, {address});
  WaitObfSet();
  return TakeOutput();
}

void EcChip::WriteEcWord(std::uint16_t address, std::uint8_t value) {
  WaitObfSet();
  Send(kWriteWordCommand, {HighByte(address), LowByte(address), value});
}

std::uint32_t EcChip::ReadFanTach(int fan, int /*arg*/) {
  const auto* addresses = RowOf(kTachAddresses, fan);
  if (addresses == nullptr) {
    return kNoTach;
  }
  const std::uint8_t low = ReadEc((*addresses)[0]);
  const std::uint8_t high = ReadEc((*addresses)[1]);
  WriteEcWord(kFanControl, kAutomatic);
  return WordOf(high, low);
}

int EcChip::TachToRpm(std::uint32_t raw, int /*multiplier*/) {
  return raw == 0 || raw >= kNoTach ? 0 : static_cast<int>(60.0 / (raw * kTachPeriod_s));
}

bool EcChip::SetFanPwm(int fan, int value) {
  const std::uint16_t* duty = RowOf(kDuty, fan);
  if (duty == nullptr) {
    return false;
  }
  WriteEcWord(kFanControl, kManual);
  WriteEcWord(*duty, LowByte(static_cast<std::uint32_t>(value)));
  return true;
}

bool EcChip::ReadTemperature(int zone, int& value) {
  if (zone != 1) {
    value = kNoTemperature;
    return false;
  }
  value = ReadEc(kTemperature);
  return true;
}

void EcChip::SetPowerLed(std::uint8_t mode, std::uint8_t control) {
  Send(kLedModeCommand, {mode});
  Send(kLedControlCommand, {control});
}

bool EcChip::AssertPowerLedGreen() {
  SetPowerLed(3, 0);
  return true;
}

bool EcChip::AssertPowerLedRed() {
  SetPowerLed(4, 0);
  return true;
}

bool EcChip::DeassertPowerLed() {
  SetPowerLed(0, 0);
  return true;
}

bool EcChip::RestorePowerLedState() {
  SetPowerLed(5, 1);
  return true;
}

}  // namespace panelglow
