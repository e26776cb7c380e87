// The PCI functions of the machine, as the device tree lists them.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace panelglow {

struct PciDevice {
  std::uint16_t vendorId = 0;
  std::uint16_t deviceId = 0;
  std::uint16_t subVendorId = 0;
  std::uint16_t subDeviceId = 0;
  std::uint32_t classCode = 0xFFFFFF;  // base class, subclass, interface: 24 bits; all set when unknown
  std::uint8_t revision = 0;
  unsigned earlierEqual = 0;  // entries ahead of this one with the same vendor and device
  std::uint8_t bus = 0;       // this and the next two are 0 when neither the system nor the driver tells them
  std::uint8_t device = 0;
  std::uint8_t function = 0;
  std::uint32_t slot = 0;  // UI number; 0: it has none
  std::string driverKey;
  std::string description;
  std::string instanceId;
};

class PciDeviceList {
 public:
  static constexpr std::size_t kMostDevices = 128;

  /// Thrown as an integer when the inventory cannot be read.
  static constexpr int kNoInventory = 129;

  /// The inventory of this process, read at first use. Throws kNoInventory; the next call tries again.
  static const PciDeviceList& Instance();

  /// Lets the inventory be read anew; for a process that runs one machine after the other, as tests do.
  static void Forget();

  /// Reads the device tree. Throws kNoInventory.
  PciDeviceList();

  [[nodiscard]] int CountDevices(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subVendorId,
                                 std::uint32_t subDeviceId) const;

  /// Copies the n-th such device, counted from 1. False when there are fewer.
  bool FindDevice(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subVendorId,
                  std::uint32_t subDeviceId, int n, PciDevice& out) const;

  [[nodiscard]] const std::vector<PciDevice>& Devices() const { return devices; }

 private:
  void Add(PciDevice device);

  std::vector<PciDevice> devices;
  // Places in the list by vendor, device, subsystem vendor and subsystem device, in its order.
  std::map<std::array<std::uint32_t, 4>, std::vector<std::size_t>> places;
};

}  // namespace panelglow
