#include "board/chips/generic/GMemorySpaceChip.h"

#include <optional>

#include "board/base/IniReader.h"
#include "board/parts/BitName.h"
#include "board/parts/Lines.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kDefaultGpioBar = 0xFED80100;
constexpr std::uint32_t kFlipSettle_ms = 30;

}  // namespace

// The block's address is a setting of the board, under the chip's name or under the section that it is given.
GMemorySpaceChip::GMemorySpaceChip() : MaskedLedChip("g_memoryspace", 32), memory(devio), gpioBar(kDefaultGpioBar) {
  unsigned int bar = ReadIniUnsigned("chip." + name + ".gpiobar", 0);
  if (bar == 0 && section != name) {
    bar = ReadIniUnsigned("chip." + section + ".gpiobar", 0);
  }
  if (bar != 0) {
    gpioBar = bar;
  }
}

// A read that fails leaves the byte as it stood: the operation goes on with 0.
std::uint8_t GMemorySpaceChip::ReadRegisterByte(std::uint32_t address) {
  return memory.ReadByte(address).value_or(0);
}

void GMemorySpaceChip::WriteRegisterByte(std::uint32_t address, std::uint8_t value) {
  memory.WriteByte(address, value);
}

void GMemorySpaceChip::SetEntry(std::uint32_t address, std::uint8_t mask) {
  WriteRegisterByte(address, ReadRegisterByte(address) | mask);
}

void GMemorySpaceChip::KeepEntry(std::uint32_t address, std::uint8_t mask) {
  WriteRegisterByte(address, ReadRegisterByte(address) & mask);
}

void GMemorySpaceChip::FlipEntry(std::uint32_t address, std::uint8_t mask) {
  WriteRegisterByte(address, ReadRegisterByte(address) ^ mask);
  platform::TheHost().clock.Sleep(kFlipSettle_ms);
}

int GMemorySpaceChip::ReadLineByNames(std::uint32_t offset, const std::string& bitName,
                                      const std::string& /*clearBitName*/) {
  const std::optional<std::uint32_t> word = memory.Read(gpioBar + offset, 2);
  return word ? LineState((*word & MaskOfBitName(bitName, 16)) != 0) : kNoSuchLine;
}

}  // namespace panelglow
