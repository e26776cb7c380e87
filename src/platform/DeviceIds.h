// The texts by which the device installation service names devices.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow::platform {

/// What a PCI function says it is.
struct PciFunctionIds {
  std::uint16_t vendorId = 0;
  std::uint16_t deviceId = 0;
  std::uint16_t subVendorId = 0;
  std::uint16_t subDeviceId = 0;
  std::uint32_t classCode = 0;  // 24 bits: class, subclass, programming interface
  std::uint8_t revision = 0;
};

/// From the narrowest to the widest.
std::vector<std::string> PciHardwareIds(const PciFunctionIds& identity);

/// `location`: bus in the high byte, device in bits 7 to 3, function below.
std::string PciLocationText(std::uint16_t location);
std::string PciInstanceId(const PciFunctionIds& identity, std::uint16_t location);

/// The path of a device's disk interface, as the system makes it from the instance id.
std::string DiskInterfacePath(std::string_view instanceId);

/// Everything ahead of the last backslash: what the device is, without which one of its kind it is.
std::string DeviceIdOf(const std::string& instanceId);

}  // namespace panelglow::platform
