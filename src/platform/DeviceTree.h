// The platform's device installation service: the tree of device nodes, and lists of devices and of their interfaces.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace panelglow::platform {

/// A node of the device tree; 0 names none.
using DeviceNode = std::uint32_t;

/// Flags of a device list.
inline constexpr std::uint32_t kPresentDevices = 2;
inline constexpr std::uint32_t kAllDeviceClasses = 4;
inline constexpr std::uint32_t kDeviceInterfaces = 16;

/// Properties of a device in a list.
inline constexpr std::uint32_t kDescriptionProperty = 0;
inline constexpr std::uint32_t kHardwareIdProperty = 1;
inline constexpr std::uint32_t kDriverProperty = 9;
inline constexpr std::uint32_t kLocationProperty = 13;
inline constexpr std::uint32_t kUiNumberProperty = 16;

/// The same of a node, which counts from 1.
inline constexpr std::uint32_t kNodeUiNumberProperty = 17;

/// Types of a property's bytes.
inline constexpr std::uint32_t kTextType = 1;
inline constexpr std::uint32_t kBinaryType = 3;
inline constexpr std::uint32_t kNumberType = 4;        // a little-endian dword
inline constexpr std::uint32_t kMultipleTextType = 7;  // texts that end with NUL, and one NUL more

/// Interface class of disks, GUID_DEVINTERFACE_DISK.
inline constexpr std::string_view kDiskInterface = "53F56307-B6BF-11D0-94F2-00A0C91EFB8B";

struct DeviceProperty {
  std::uint32_t type = 0;
  std::vector<std::uint8_t> bytes;
};

/// A path by which a device can be opened, and whose it is.
struct DeviceInterface {
  std::string path;
  DeviceNode device = 0;
};

/// A list of devices as it was when it was opened; closed with the object.
class DeviceList {
 public:
  virtual ~DeviceList() = default;

  /// Nothing behind the end of the list.
  virtual std::optional<DeviceNode> Device(std::uint32_t index) = 0;

  /// The interfaces of the list's class, of all its devices in order; nothing behind the last.
  virtual std::optional<DeviceInterface> Interface(std::uint32_t index) = 0;

  /// Nothing when the device of the list has no such property.
  virtual std::optional<DeviceProperty> Property(DeviceNode device, std::uint32_t property) = 0;
};

class DeviceTree {
 public:
  virtual ~DeviceTree() = default;

  // Each gives 0 when there is no such node. Children and siblings come in an order that stays the same.
  virtual DeviceNode Locate(std::string_view instanceId) = 0;
  virtual DeviceNode Child(DeviceNode node) = 0;
  virtual DeviceNode Sibling(DeviceNode node) = 0;
  virtual DeviceNode Parent(DeviceNode node) = 0;

  /// Nothing for a node that is not there (any more).
  virtual std::optional<std::string> InstanceId(DeviceNode node) = 0;
  virtual std::optional<DeviceProperty> NodeProperty(DeviceNode node, std::uint32_t property) = 0;

  /// `enumerator`: "PCI", an instance id, or empty for all; `interfaceClass` is needed with kDeviceInterfaces. Null
  /// when the list cannot be had; a list without entries is no failure.
  virtual std::unique_ptr<DeviceList> Open(std::string_view enumerator, std::uint32_t flags,
                                           std::string_view interfaceClass) = 0;
};

}  // namespace panelglow::platform
