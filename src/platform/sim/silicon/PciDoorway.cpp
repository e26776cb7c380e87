#include "platform/sim/silicon/PciDoorway.h"

#include <cstdio>

namespace panelglow::platform::sim {

namespace {

constexpr std::uint32_t kAddressBits = 0x80FFFFFC;
constexpr unsigned kDwordBytes = 4;

}  // namespace

std::uint8_t PciDoorway::ReadPort(std::uint16_t port) {
  bytes_ = 0;
  if (port < kDataPort) {
    return static_cast<std::uint8_t>(address_ >> (8U * (port - kAddressPort)));
  }
  return IsEnabled() ? buses_.ReadPciByte(Location(), Register(port)) : std::uint8_t{0xFF};
}

void PciDoorway::WritePort(std::uint16_t port, std::uint8_t value) {
  const unsigned byte = static_cast<unsigned>(port) - kAddressPort;
  if (port >= kDataPort) {
    bytes_ = 0;
    if (IsEnabled()) {
      buses_.WritePciByte(Location(), Register(port), value);
    }
    return;
  }
  if (byte == 0) {
    coming_ = value;
    bytes_ = 1;
  } else if (byte == bytes_) {
    coming_ |= static_cast<std::uint32_t>(value) << (8U * byte);
    ++bytes_;
  } else {
    bytes_ = 0;
  }
  if (bytes_ == kDwordBytes) {
    address_ = coming_ & kAddressBits;
    bytes_ = 0;
  }
}

std::string PciDoorway::State() const {
  std::string text;
  char part[32];
  for (const PciFunction& function : buses_.PciFunctions()) {
    std::snprintf(part, sizeof part, "pci %04X registers", function.location);
    text += part;
    for (const auto& [offset, value] : function.registers) {
      std::snprintf(part, sizeof part, " %02X=%08X", offset, value);
      text += part;
    }
    text += "\n";
  }
  return text;
}

}  // namespace panelglow::platform::sim
