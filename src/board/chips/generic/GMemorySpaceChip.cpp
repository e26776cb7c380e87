#include "board/chips/generic/GMemorySpaceChip.h"

#include <array>
#include <cstddef>

#include "board/base/IniReader.h"
#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kDefaultGpioBar = 0xFED80100;
constexpr std::uint32_t kFlipSettle_ms = 30;

}  // namespace

// The block's address is a setting of the board, under the chip's name or under the section that it is given.
GMemorySpaceChip::GMemorySpaceChip() : MaskedLedChip("g_memoryspace", 32), gpioBar(kDefaultGpioBar) {
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
  std::array<std::byte, 1> byte{};
  devio.ReadPhysicalMemory(address, 1, byte);
  return std::to_integer<std::uint8_t>(byte[0]);
}

void GMemorySpaceChip::WriteRegisterByte(std::uint32_t address, std::uint8_t value) {
  const std::array<std::byte, 1> byte{std::byte{value}};
  devio.WritePhysicalMemory(address, 1, byte);
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
  std::array<std::byte, 2> bytes{};
  if (devio.ReadPhysicalMemory(gpioBar + offset, 2, bytes) == 0) {
    return kNoSuchLine;
  }
  const auto word = std::to_integer<unsigned>(bytes[0]) | std::to_integer<unsigned>(bytes[1]) << 8U;
  const auto bit = static_cast<unsigned>(CDMUtil::ToInt(bitName));
  return bit < 16 && (word >> bit & 1U) != 0 ? kAsserted : kNotAsserted;
}

}  // namespace panelglow
