#include "board/chips/southbridge/SbxChip.h"

#include <array>
#include <optional>
#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/IndexedPorts.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

// First line, last line, configuration register, bit of the first line.
constexpr std::array<LineRange, 7> kLines{{{0, 3, 0x80, 8},
                                           {4, 9, 0xA8, 16},
                                           {10, 10, 0xA8, 26},
                                           {11, 12, 0xA8, 22},
                                           {49, 52, 0x50, 8},
                                           {53, 56, 0x52, 8},
                                           {43, 44, 0x00, 17}}};

// Its levels count when they are read a second time: the first read only makes them current. That is a choice; no
// data sheet at hand shows these two lines.
constexpr std::uint16_t kReadTwice = 0x00;

// The hood switch, behind the index and data port of the power management registers.
constexpr int kLatchLine = 238;
constexpr std::uint16_t kPowerIndex = 0xCD6;
constexpr std::uint32_t kLatchRegister = 0x54;
constexpr std::uint8_t kLatched = 0x08;
constexpr int kMostClears = 2;
constexpr std::uint32_t kLatchSettle_ms = 10;

}  // namespace

SbxChip::SbxChip() : SbxChip("sbx", "chip.sbx.", kLines) {}

SbxChip::SbxChip(std::string chipName, const std::string& prefix, std::span<const LineRange> map)
    : Chip(std::move(chipName)),
      lines(map),
      smbusbar(ReadIniUnsigned(prefix + "smbusbar", 0x8000A000)),
      pciIndex(ReadIniWord(prefix + "pciindex", 0xCF8)),
      pciData(ReadIniWord(prefix + "pcidata", 0xCFC)) {}

std::uint32_t SbxChip::ReadConfig(std::uint16_t reg) {
  devio.OutportDword(pciIndex, smbusbar + reg);
  return devio.InportDword(pciData);
}

// The latch is cleared by writing it as it reads and then without its bit. One that is set again at once is cleared
// once more: only a switch that stays open sets it every time.
int SbxChip::ReadLatch() {
  const IndexedPorts power(devio, kPowerIndex);
  const std::uint8_t reg = LowByte(smbusbar + kLatchRegister);
  std::uint8_t status = power.Read(reg);
  for (int clear = 0; clear < kMostClears && (status & kLatched) != 0; ++clear) {
    power.Write(reg, status);
    platform::TheHost().clock.Sleep(kLatchSettle_ms);
    power.Write(reg, static_cast<std::uint8_t>(status & ~kLatched));
    status = power.Read(reg);
  }
  return LineState((status & kLatched) != 0);
}

int SbxChip::ReadLine(int line) {
  if (line == kLatchLine) {
    return ReadLatch();
  }
  const std::optional<LinePlace> place = FindLine(lines, line);
  if (!place) {
    return kNoSuchLine;
  }
  if (place->place == kReadTwice) {
    ReadConfig(place->place);
  }
  return LineState((ReadConfig(place->place) & place->mask) != 0);
}

}  // namespace panelglow
