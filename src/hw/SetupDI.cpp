#include "hw/SetupDI.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <optional>

#include "platform/Host.h"

namespace panelglow {

namespace {

using platform::DeviceNode;

constexpr std::size_t kPropertyBuffer = 1024;

platform::DeviceTree& Tree() { return platform::TheHost().deviceTree; }

// A text property as it stands in a buffer of this size: up to its first NUL, or all that there is room for.
std::string_view TextIn(std::span<const std::uint8_t> bytes) {
  const std::string_view text(reinterpret_cast<const char*>(bytes.data()), bytes.size());
  return text.substr(0, text.find('\0'));
}

}  // namespace

SetupDI::SetupDI(const char* instanceId) {
  if (instanceId != nullptr) {
    devNode = Tree().Locate(instanceId);
  }
}

void SetupDI::SetDevice(const char* instanceId) {
  SetDevNode(instanceId == nullptr ? DeviceNode{0} : Tree().Locate(instanceId));
}

void SetupDI::SetDevNode(DeviceNode node) {
  devNode = node;
  childCount = 0;
}

bool SetupDI::NextChild(SetupDI& child) {
  if (devNode == 0) {
    return false;
  }
  const DeviceNode node = childCount == 0 ? Tree().Child(devNode) : Tree().Sibling(lastChild);
  if (node == 0) {
    return false;
  }
  child.SetDevNode(node);
  lastChild = node;
  ++childCount;
  return true;
}

bool SetupDI::GetParent(SetupDI& parent) {
  const DeviceNode node = devNode == 0 ? DeviceNode{0} : Tree().Parent(devNode);
  if (node == 0) {
    return false;
  }
  parent.SetDevNode(node);
  return true;
}

std::string SetupDI::GetDeviceInstanceId() const { return Tree().InstanceId(devNode).value_or(""); }

// ---- lists

bool SetupDI::OpenDeviceList(std::string_view enumerator, std::uint32_t flags, std::string_view interfaceClass) {
  deviceInfoSet = Tree().Open(enumerator, flags, interfaceClass);
  if (!deviceInfoSet) {
    return false;
  }
  nextDevice = 0;
  childCount = 0;
  nextInterface = 0;
  currentInterface.reset();
  return true;
}

bool SetupDI::NextDevice() {
  const std::optional<DeviceNode> found = deviceInfoSet ? deviceInfoSet->Device(nextDevice++) : std::nullopt;
  deviceInfoData = found.value_or(deviceInfoData);
  SetDevNode(deviceInfoData);
  return found.has_value();
}

bool SetupDI::NextInterface() {
  const std::optional<platform::DeviceInterface> found =
      deviceInfoSet ? deviceInfoSet->Interface(nextInterface++) : std::nullopt;
  currentInterface = found ? found : currentInterface;
  return found.has_value();
}

std::string SetupDI::GetInterfaceDevicePath(std::string_view instanceId, std::string_view interfaceClass) {
  deviceInfoSet = Tree().Open(instanceId, platform::kPresentDevices | platform::kDeviceInterfaces, interfaceClass);
  nextInterface = 0;
  currentInterface.reset();
  NextInterface();
  return PathOfCurrentInterface();
}

std::string SetupDI::GetInterfaceDevicePath() { return PathOfCurrentInterface(); }

std::string SetupDI::PathOfCurrentInterface() {
  if (!currentInterface) {
    return {};
  }
  devNode = currentInterface->device;
  deviceInfoData = currentInterface->device;
  return currentInterface->path;
}

// ---- properties

std::uint32_t SetupDI::ReadNodeProperty(std::uint32_t property, std::span<std::uint8_t> buffer,
                                        std::uint32_t& type) const {
  const std::optional<platform::DeviceProperty> found = Tree().NodeProperty(devNode, property);
  if (!found || found->bytes.size() > buffer.size()) {
    return 0;
  }
  type = found->type;
  std::copy(found->bytes.begin(), found->bytes.end(), buffer.begin());
  return static_cast<std::uint32_t>(found->bytes.size());
}

bool SetupDI::ReadDeviceProperty(std::uint32_t property, std::span<std::uint8_t> buffer, std::uint32_t& size,
                                 std::uint32_t& type) {
  const std::optional<platform::DeviceProperty> found =
      deviceInfoSet ? deviceInfoSet->Property(deviceInfoData, property) : std::nullopt;
  if (!found) {
    return false;
  }
  size = static_cast<std::uint32_t>(found->bytes.size());
  type = found->type;
  if (found->bytes.size() > buffer.size()) {
    return false;
  }
  std::copy(found->bytes.begin(), found->bytes.end(), buffer.begin());
  return true;
}

bool SetupDI::FindPciDevice(std::uint16_t vendorId, std::uint16_t deviceId, std::uint16_t subVendorId,
                            std::uint16_t subDeviceId, std::string& deviceDescription) {
  std::array<char, 64> wanted{};
  std::snprintf(wanted.data(), wanted.size(), "PCI\\VEN_%04X&DEV_%04X&SUBSYS_%04X%04X", vendorId, deviceId,
                subDeviceId, subVendorId);
  if (!OpenDeviceList("PCI", platform::kPresentDevices | platform::kAllDeviceClasses, "")) {
    return false;
  }
  std::array<std::uint8_t, kPropertyBuffer> buffer{};
  std::uint32_t size = 0;
  std::uint32_t type = 0;
  while (NextDevice()) {
    if (ReadDeviceProperty(platform::kHardwareIdProperty, buffer, size, type) &&
        TextIn(std::span(buffer).first(size)).find(wanted.data()) != std::string_view::npos) {
      const bool isDescribed = ReadDeviceProperty(platform::kDescriptionProperty, buffer, size, type);
      deviceDescription = TextIn(isDescribed ? std::span(buffer).first(size) : std::span(buffer));
      return true;
    }
  }
  return false;
}

}  // namespace panelglow
