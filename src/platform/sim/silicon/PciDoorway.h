// The doorway from I/O ports to PCI configuration space, on every machine that has a function there.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "platform/sim/silicon/Buses.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// 0xCF8: address register, which takes dwords alone: bit 31 enable, 23 to 16 bus, 15 to 11 device, 10 to 8 function,
/// 7 to 2 register; the two lowest bits are 0. 0xCFC to 0xCFF: the bytes of that register of the function. Disabled,
/// or without such a function, they read as ones and take nothing.
class PciDoorway : public Device {
 public:
  static constexpr std::uint16_t kAddressPort = 0xCF8;
  static constexpr std::uint16_t kDataPort = 0xCFC;

  /// The buses stay with the caller.
  explicit PciDoorway(Buses& buses) : buses_(buses) {}

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override { return {{kAddressPort, 8}}; }
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view /*pin*/) const override { return {}; }
  /// The configuration registers of all functions; not the address, which every user sets for itself.
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::uint16_t Location() const { return static_cast<std::uint16_t>(address_ >> 8U); }
  [[nodiscard]] std::uint16_t Register(std::uint16_t port) const {
    return static_cast<std::uint16_t>((address_ & 0xFCU) + (port - kDataPort));
  }
  [[nodiscard]] bool IsEnabled() const { return address_ >> 31U != 0; }

  Buses& buses_;
  std::uint32_t address_ = 0;
  // A dword comes as four bytes in a row; anything else is no access to the address register.
  std::uint32_t coming_ = 0;
  unsigned bytes_ = 0;
};

}  // namespace panelglow::platform::sim
