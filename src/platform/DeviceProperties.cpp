#include "platform/DeviceProperties.h"

namespace panelglow::platform {

namespace {

void AppendText(std::vector<std::uint8_t>& bytes, const std::string& text) {
  bytes.insert(bytes.end(), text.begin(), text.end());
  bytes.push_back(0);
}

std::optional<DeviceProperty> TextProperty(const std::string& text) {
  if (text.empty()) {
    return std::nullopt;
  }
  DeviceProperty property{kTextType, {}};
  AppendText(property.bytes, text);
  return property;
}

}  // namespace

std::optional<DeviceProperty> PropertyOf(const DeviceDescription& device, std::uint32_t property) {
  switch (property) {
    case kDescriptionProperty:
      return TextProperty(device.description);
    case kDriverProperty:
      return TextProperty(device.driverKey);
    case kLocationProperty:
      return TextProperty(device.location);
    case kHardwareIdProperty: {
      DeviceProperty ids{kMultipleTextType, {}};
      for (const std::string& id : device.hardwareIds) {
        AppendText(ids.bytes, id);
      }
      ids.bytes.push_back(0);
      return ids;
    }
    case kUiNumberProperty: {
      if (!device.uiNumber) {
        return std::nullopt;
      }
      DeviceProperty number{kNumberType, {}};
      for (unsigned shift = 0; shift < 32; shift += 8) {
        number.bytes.push_back(static_cast<std::uint8_t>(*device.uiNumber >> shift));
      }
      return number;
    }
    default:
      return std::nullopt;
  }
}

}  // namespace panelglow::platform
