// The devices of a simulated machine as its system has enumerated them: a tree, built once from the machine's
// description.
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/DeviceProperties.h"
#include "platform/DeviceTree.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

struct InventoryEntry {
  std::string instanceId = {};
  DeviceDescription told = {};     // the driver key is made from the class
  std::string classId = {};        // of its set-up class; empty: none
  std::string interfacePath = {};  // of the disk interface; empty: it has none
  std::string device = {};         // name of the part behind it when that can go; empty otherwise

  DeviceNode parent = 0;
  std::vector<DeviceNode> children = {};
  std::size_t place = 0;  // among its parent's children
};

/// The root has the computer's own devices, the PCI host bridge among them, which has all PCI functions in the order
/// of their places; a controller has its disks in the order of the description.
class DeviceInventory {
 public:
  /// `isThere` tells of a part by its name whether it is still there. Throws MachineError when an id occurs twice or
  /// a parent is missing.
  DeviceInventory(const MachineDescription& machine, std::function<bool(const std::string& device)> isThere);

  static constexpr DeviceNode kRoot = 1;

  /// Every node counts from 1 in the order of the list.
  [[nodiscard]] const std::vector<InventoryEntry>& Entries() const { return entries_; }

  /// Null when there is no such node, or its part has gone.
  [[nodiscard]] const InventoryEntry* Find(DeviceNode node) const;

  /// The same of one that may have gone.
  [[nodiscard]] const InventoryEntry* FindEver(DeviceNode node) const;

  /// By instance id without regard to case, gone or not; 0 when there never was one.
  [[nodiscard]] DeviceNode NodeOf(std::string_view instanceId) const;

  [[nodiscard]] bool IsThere(DeviceNode node) const { return Find(node) != nullptr; }

 private:
  DeviceNode Add(DeviceNode parent, InventoryEntry entry);
  void AddPciFunctions(const MachineDescription& machine, DeviceNode bridge);
  DeviceNode AddController(const MachineDescription& machine, const ControllerDescription& controller,
                           DeviceNode parent);

  std::vector<InventoryEntry> entries_;
  std::map<std::string, DeviceNode, std::less<>> nodes_;  // by lowered instance id
  std::map<std::string, unsigned> drivers_;               // driver keys given out, by class
  std::function<bool(const std::string&)> isThere_;
};

/// The instance id that the system gives a function.
std::string PciInstanceId(const PciFunction& function);

}  // namespace panelglow::platform::sim
