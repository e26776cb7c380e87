#include "board/chips/ec/EcIt8518Chip.h"

#include "board/parts/BitName.h"
#include "board/parts/Lines.h"
#include "board/parts/Pulse.h"
#include "board/parts/RowOf.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kTachLow = 0x54;
constexpr std::uint8_t kTachHigh = 0x53;
constexpr std::uint8_t kTemperatures[2] = {0x40, 0x41};
constexpr std::uint8_t kLedModeCommand = 0xA2;
constexpr std::uint8_t kLedControlCommand = 0xEE;

constexpr std::uint16_t kStatusPort = 0x66;
constexpr std::uint16_t kDataPort = 0x62;

constexpr std::uint32_t kNoTach = 0xFFFF;
constexpr int kNoTemperature = 255;

}  // namespace

std::uint32_t EcIt8518Chip::ReadFanTach(int fan, int /*arg*/) {
  if (fan != 1) {
    return kNoTach;
  }
  const std::uint8_t low = ReadEc(kTachLow);
  return WordOf(ReadEc(kTachHigh), low);
}

bool EcIt8518Chip::ReadTemperature(int zone, int& value) {
  const std::uint8_t* address = RowOf(kTemperatures, zone);
  if (address == nullptr) {
    value = kNoTemperature;
    return false;
  }
  value = ReadEc(*address);
  return true;
}

bool EcIt8518Chip::SetPowerLed(std::uint8_t mode) {
  Send(kLedModeCommand, {mode});
  Send(kLedControlCommand, {0});
  return true;
}

int EcIt8518Chip::ReadLineByNames(std::uint32_t offset, const std::string& bitName, const std::string& clearBitName) {
  const std::uint8_t reg = LowByte(offset);
  if (!clearBitName.empty()) {
    const std::uint32_t clear = MaskOfBitName(clearBitName, 8);
    const std::uint8_t value = ReadEc(reg);
    const auto write = [&](std::uint8_t pulse) {
      devio.OutportByte(kStatusPort, reg);
      devio.OutportByte(kDataPort, pulse);
    };
    SendPulse(write, LowByte(value | clear), LowByte(value & ~clear));
  }
  return LineState((ReadEc(reg) & MaskOfBitName(bitName, 8)) != 0);
}

}  // namespace panelglow
