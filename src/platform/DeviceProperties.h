// Makes the bytes of device properties, as the device installation service gives them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "platform/DeviceTree.h"

namespace panelglow::platform {

/// What a device tells of itself. What is empty, it does not tell.
struct DeviceDescription {
  std::string description = {};
  std::vector<std::string> hardwareIds = {};
  std::string driverKey = {};
  std::string location = {};
  std::optional<std::uint32_t> uiNumber = {};
};

/// `property` by its number in a list. Nothing when the device has no such property.
std::optional<DeviceProperty> PropertyOf(const DeviceDescription& device, std::uint32_t property);

}  // namespace panelglow::platform
