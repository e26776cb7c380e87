#include "platform/sim/silicon/LegacyPanelBlock.h"

#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint16_t kGreenOffset = 0x33;
constexpr std::uint16_t kRedOffset = 0x34;
constexpr std::uint16_t kDataOffset = 0x4D;
constexpr std::uint8_t kNativeMode = 0x04;
constexpr std::uint8_t kRedBit = 0x01;
constexpr std::uint8_t kGreenBit = 0x02;
constexpr std::uint8_t kDriveBit = 0x80;

}  // namespace

std::vector<AddressRange> LegacyPanelBlock::PortRanges() const {
  return {{static_cast<std::uint64_t>(base_) + kGreenOffset, 2},
          {static_cast<std::uint64_t>(base_) + kDataOffset, 1},
          {kChipsetGpioData, 1}};
}

std::uint8_t* LegacyPanelBlock::Register(std::uint16_t port) {
  if (port == base_ + kGreenOffset) {
    return &greenConfiguration_;
  }
  if (port == base_ + kRedOffset) {
    return &redConfiguration_;
  }
  return port == kChipsetGpioData ? &chipsetGpio_ : &data_;
}

std::uint8_t LegacyPanelBlock::ReadPort(std::uint16_t port) { return *Register(port); }

void LegacyPanelBlock::WritePort(std::uint16_t port, std::uint8_t value) { *Register(port) = value; }

std::optional<bool> LegacyPanelBlock::Signal(std::string_view pin) const {
  const bool bothDriven = (data_ & (kRedBit | kGreenBit)) == (kRedBit | kGreenBit);
  if (pin == "power-green") {
    return (greenConfiguration_ & kNativeMode) != 0 || (!bothDriven && (data_ & kGreenBit) != 0);
  }
  if (pin == "power-red") {
    return (redConfiguration_ & kNativeMode) == 0 && !bothDriven && (data_ & kRedBit) != 0;
  }
  if (pin == "drive-red") {
    return (chipsetGpio_ & kDriveBit) != 0;
  }
  return std::nullopt;
}

std::optional<std::uint64_t> LegacyPanelBlock::RegisterOf(std::string_view pin) const {
  if (pin == "drive-red") {
    return kChipsetGpioData;
  }
  return base_ + kDataOffset;
}

std::string LegacyPanelBlock::State() const {
  char text[128];
  std::snprintf(text, sizeof text, "port %04X = %02X\nport %04X = %02X\nport %04X = %02X\nport %04X = %02X\n",
                base_ + kGreenOffset, greenConfiguration_, base_ + kRedOffset, redConfiguration_, base_ + kDataOffset,
                data_, kChipsetGpioData, chipsetGpio_);
  return text;
}

}  // namespace panelglow::platform::sim
