// Rows of the management classes that tell of devices.
#pragma once

#include <string_view>

#include "platform/Management.h"
#include "platform/Text.h"

namespace panelglow::platform::management {

/// Namespaces, without regard to case: of devices, and of what the firmware's drivers tell.
inline constexpr std::string_view kDeviceNameSpace = "root\\cimv2";
inline constexpr std::string_view kFirmwareNameSpace = "root\\wmi";

/// Of a connection that failed because there is no such namespace.
inline constexpr std::uint32_t kInvalidNameSpace = 0x8004100E;

inline void SetText(ManagementRow& row, std::u16string_view property, std::string_view text) {
  row.Set(property, {ManagementScalar(WideFromUtf8(text))});
}

/// What every class of devices has.
inline ManagementRow RowOfDevice(std::string_view instanceId, std::string_view description) {
  ManagementRow row;
  SetText(row, u"PNPDeviceID", instanceId);
  SetText(row, u"DeviceID", instanceId);
  SetText(row, u"Description", description);
  SetText(row, u"Name", description);
  return row;
}

/// A namespace without the mark of this machine that may stand in front of it.
inline std::string_view LocalNameSpace(std::string_view nameSpace) {
  constexpr std::string_view kThisMachine = "\\\\.\\";
  return nameSpace.substr(0, kThisMachine.size()) == kThisMachine ? nameSpace.substr(kThisMachine.size()) : nameSpace;
}

/// The row of the firmware's structure table, class MSSmBios_RawSMBiosTables.
inline ManagementRow FirmwareTableRow(const std::vector<std::uint8_t>& table) {
  ManagementRow row;
  row.Set(u"Size", {ManagementScalar(static_cast<std::uint32_t>(table.size()))});
  row.Set(u"SMBiosData", {ManagementArray(table.begin(), table.end())});
  return row;
}

}  // namespace panelglow::platform::management
