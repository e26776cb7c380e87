// Storage controllers: as the mass-storage INI file knows them, and as they are found in the machine.
#pragma once

#include <array>
#include <cstdint>
#include <string>

namespace panelglow {

/// Vendor, device, subsystem vendor, subsystem device.
using ControllerIds = std::array<std::uint32_t, 4>;

struct CTRL_INFO {
  std::uint32_t vendorId = 0;  // PCI ids of 16 bits
  std::uint32_t deviceId = 0;
  std::uint32_t subVendorId = 0;
  std::uint32_t subDeviceId = 0;
  int interfaceKind = 0;  // how its drives are reached: see InterfaceKindOf
  std::string name;
  bool sataFlag = true;     // as its section was loaded
  std::string productText;  // of a line of non-volatile storage

  [[nodiscard]] ControllerIds Ids() const { return {vendorId, deviceId, subVendorId, subDeviceId}; }
};

struct HDD_CTRL_INFO : CTRL_INFO {
  int controllerIndex = 0;     // rises with each record of the process
  std::uint32_t uiNumber = 0;  // 0: it has none
  std::string description;     // of the management service
  std::string pnpDeviceId;     // device instance id
  std::int32_t scsiPort = -1;  // -1: none was found
};

}  // namespace panelglow
