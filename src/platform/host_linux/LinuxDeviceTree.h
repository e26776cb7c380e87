// The device tree of the real machine: what the kernel has enumerated, under the names of the device installation
// service.
#pragma once

#include <map>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "platform/DeviceProperties.h"
#include "platform/DeviceTree.h"
#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

/// The root has the PCI host bridge, the floppy drives and the disks without a PCI function above them; the host
/// bridge has the PCI functions, each below the bridge that it is behind, in the order of their places; a controller
/// has its disks in the order of its own counting. The machine is looked at when a node is located and when a list is
/// opened; a walk between goes over what was there then. A device keeps its node for the life of the object, also
/// when it was away. For any thread.
class LinuxDeviceTree : public DeviceTree {
 public:
  /// Touches nothing.
  explicit LinuxDeviceTree(KernelFolders folders = {}) : folders_(std::move(folders)) {}

  DeviceNode Locate(std::string_view instanceId) override;
  DeviceNode Child(DeviceNode node) override;
  DeviceNode Sibling(DeviceNode node) override;
  DeviceNode Parent(DeviceNode node) override;
  std::optional<std::string> InstanceId(DeviceNode node) override;
  std::optional<DeviceProperty> NodeProperty(DeviceNode node, std::uint32_t property) override;
  std::unique_ptr<DeviceList> Open(std::string_view enumerator, std::uint32_t flags,
                                   std::string_view interfaceClass) override;

 private:
  class List;

  struct Entry {
    std::string instanceId = {};
    DeviceDescription told = {};
    std::string interfacePath = {};  // of the disk interface; empty: it has none
    bool isThere = false;
    DeviceNode parent = 0;
    std::vector<DeviceNode> children = {};
    std::size_t place = 0;  // among its parent's children
  };

  // Under guard_.
  void Look();
  DeviceNode Note(DeviceNode parent, std::string instanceId, DeviceDescription told, std::string interfacePath);
  [[nodiscard]] const Entry* Find(DeviceNode node) const;
  [[nodiscard]] DeviceNode NodeOf(std::string_view instanceId) const;
  [[nodiscard]] DeviceNode ChildAt(const Entry& parent, std::size_t place) const;

  const KernelFolders folders_;
  std::mutex guard_;
  std::vector<Entry> entries_;               // by node, which counts from 1
  std::vector<DeviceNode> order_;            // of those that are there
  std::map<std::string, DeviceNode> nodes_;  // by lowered instance id
};

}  // namespace panelglow::platform::host_linux
