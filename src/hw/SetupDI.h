// One node of the device tree, and a list of devices or interfaces that may be open on it. A failed call of the
// platform shows as false, 0 or an empty text.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "platform/DeviceTree.h"

namespace panelglow {

class SetupDI {
 public:
  /// No node, no list.
  SetupDI() = default;

  /// Stands for the device with this id, or for none.
  explicit SetupDI(const char* instanceId);
  virtual ~SetupDI() = default;
  SetupDI(const SetupDI&) = delete;
  SetupDI& operator=(const SetupDI&) = delete;

  [[nodiscard]] virtual platform::DeviceNode GetDevNode() const { return devNode; }

  /// Both begin the walk over the children anew.
  virtual void SetDevice(const char* instanceId);
  virtual void SetDevNode(platform::DeviceNode node);

  /// Moves `child` to this node's next child. False behind the last, where a later call asks for the same one again.
  virtual bool NextChild(SetupDI& child);
  virtual bool GetParent(SetupDI& parent);

  [[nodiscard]] std::string GetDeviceInstanceId() const;

  /// The first interface path of this class of the device with this id; empty when it has none. On success the object
  /// stands for that device.
  std::string GetInterfaceDevicePath(std::string_view instanceId, std::string_view interfaceClass);

  /// The path of the interface that NextInterface has found last.
  std::string GetInterfaceDevicePath();

  /// Opens a list, and begins the walks over it; `flags` as in platform/DeviceTree.h.
  bool OpenDeviceList(std::string_view enumerator, std::uint32_t flags, std::string_view interfaceClass);

  /// Moves to the next device of the list; at its end the object still stands for the last one.
  bool NextDevice();

  /// Finds the next interface of the list's class.
  bool NextInterface();

  /// Copies a property of the node; its length, or 0 when it has none or there is not the room.
  std::uint32_t ReadNodeProperty(std::uint32_t property, std::span<std::uint8_t> buffer, std::uint32_t& type) const;

  /// Copies a property of the list's present device. `size`: its length. `type`: that of the property.
  bool ReadDeviceProperty(std::uint32_t property, std::span<std::uint8_t> buffer, std::uint32_t& size,
                          std::uint32_t& type);

  /// The description of the first PCI device with these four ids.
  bool FindPciDevice(std::uint16_t vendorId, std::uint16_t deviceId, std::uint16_t subVendorId,
                     std::uint16_t subDeviceId, std::string& deviceDescription);

 private:
  std::string PathOfCurrentInterface();

  std::unique_ptr<platform::DeviceList> deviceInfoSet;
  platform::DeviceNode deviceInfoData = 0;  // present device of the list
  std::uint32_t nextDevice = 0;
  platform::DeviceNode devNode = 0;
  int childCount = 0;
  platform::DeviceNode lastChild = 0;
  std::uint32_t nextInterface = 0;
  std::optional<platform::DeviceInterface> currentInterface;  // found last
};

}  // namespace panelglow
