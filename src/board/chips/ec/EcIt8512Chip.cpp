#include "board/chips/ec/EcIt8512Chip.h"

#include "board/parts/Bits.h"
#include "board/parts/RowOf.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kTachAddresses[2][2] = {{0x88, 0x89}, {0x8A, 0x8B}};  // low, high
constexpr std::uint8_t kTemperatures[2] = {0x90, 0x94};
constexpr std::uint16_t kDuty[2] = {0x1804, 0x1805};
constexpr int kFullDuty = 240;

constexpr std::uint8_t kManualFanCommand = 0x70;     // data: the fan
constexpr std::uint8_t kAutomaticFanCommand = 0x71;  // data: the fan
constexpr std::uint8_t kWriteCommand = 0x9B;
constexpr std::uint8_t kGreenOn = 0xC0;
constexpr std::uint8_t kGreenOff = 0xC1;
constexpr std::uint8_t kRedOn = 0xC2;
constexpr std::uint8_t kRedOff = 0xC3;

constexpr std::uint32_t kNoTach = 0xFFFF;
constexpr int kNoTemperature = 255;

}  // namespace

std::uint32_t EcIt8512Chip::ReadFanTach(int fan, int /*arg*/) {
  const auto* addresses = RowOf(kTachAddresses, fan);
  if (addresses == nullptr) {
    return kNoTach;
  }
  const std::uint8_t low = ReadEc((*addresses)[0]);
  const std::uint8_t high = ReadEc((*addresses)[1]);
  Send(kAutomaticFanCommand, {1});
  Send(kAutomaticFanCommand, {2});
  return WordOf(high, low);
}

void EcIt8512Chip::Write8512(std::uint16_t address, std::uint8_t value) {
  Send(kWriteCommand, {HighByte(address), LowByte(address), value});
}

bool EcIt8512Chip::SetFanPwm(int fan, int value) {
  const std::uint16_t* duty = RowOf(kDuty, fan);
  if (duty == nullptr) {
    return false;
  }
  Send(kManualFanCommand, {1});
  Send(kManualFanCommand, {2});
  Write8512(*duty, LowByte(static_cast<std::uint32_t>(value)));
  return true;
}

bool EcIt8512Chip::SetFanFullSpeed(int fan) { return SetFanPwm(fan, kFullDuty); }

bool EcIt8512Chip::ReadTemperature(int zone, int& value) {
  const std::uint8_t* address = RowOf(kTemperatures, zone);
  if (address == nullptr) {
    value = kNoTemperature;
    return false;
  }
  value = ReadEc(*address);
  return true;
}

bool EcIt8512Chip::AssertPowerLedGreen() {
  Send(kGreenOn, {});
  return true;
}

bool EcIt8512Chip::AssertPowerLedRed() {
  Send(kRedOn, {});
  return true;
}

bool EcIt8512Chip::DeassertPowerLed() {
  Send(kGreenOff, {});
  Send(kRedOff, {});
  return true;
}

}  // namespace panelglow
