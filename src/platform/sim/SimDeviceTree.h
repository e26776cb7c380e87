// The device installation service of a simulated machine, on its inventory.
#pragma once

#include <memory>
#include <string>

#include "platform/DeviceTree.h"
#include "platform/sim/DeviceInventory.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimDeviceTree : public DeviceTree {
 public:
  SimDeviceTree(const DeviceInventory& inventory, Scheduler& scheduler)
      : inventory_(inventory), scheduler_(scheduler) {}

  /// An empty id is the root's.
  DeviceNode Locate(std::string_view instanceId) override;
  DeviceNode Child(DeviceNode node) override;
  DeviceNode Sibling(DeviceNode node) override;
  DeviceNode Parent(DeviceNode node) override;
  std::optional<std::string> InstanceId(DeviceNode node) override;
  std::optional<DeviceProperty> NodeProperty(DeviceNode node, std::uint32_t property) override;

  /// Like the genuine service: an interface list takes an instance id as enumerator, any other list the name of one,
  /// and that only with kAllDeviceClasses.
  std::unique_ptr<DeviceList> Open(std::string_view enumerator, std::uint32_t flags,
                                   std::string_view interfaceClass) override;

 private:
  class List;

  [[nodiscard]] DeviceNode FirstThere(const InventoryEntry& parent, std::size_t place) const;

  const DeviceInventory& inventory_;
  Scheduler& scheduler_;
};

}  // namespace panelglow::platform::sim
