#include "platform/sim/SimDeviceTree.h"

#include <utility>

#include "platform/AsciiCase.h"

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kCallCost_us = 20;
constexpr Microseconds kListCost_us = 1000;

}  // namespace

// The devices as they were when the list was opened; what it tells of one that has gone since is what was registered.
class SimDeviceTree::List : public DeviceList {
 public:
  List(SimDeviceTree& owner, std::vector<DeviceNode> devices, bool ofDisks)
      : owner_(owner), devices_(std::move(devices)), ofDisks_(ofDisks) {}

  std::optional<DeviceNode> Device(std::uint32_t index) override {
    owner_.scheduler_.Spend(kCallCost_us);
    return index < devices_.size() ? std::optional<DeviceNode>(devices_[index]) : std::nullopt;
  }

  // A device here has one interface of a class at most, and is in an interface list only with it.
  std::optional<DeviceInterface> Interface(std::uint32_t index) override {
    owner_.scheduler_.Spend(kCallCost_us);
    if (!ofDisks_ || index >= devices_.size()) {
      return std::nullopt;
    }
    return DeviceInterface{owner_.inventory_.FindEver(devices_[index])->interfacePath, devices_[index]};
  }

  std::optional<DeviceProperty> Property(DeviceNode device, std::uint32_t property) override {
    owner_.scheduler_.Spend(kCallCost_us);
    for (const DeviceNode own : devices_) {
      if (own == device) {
        return PropertyOf(owner_.inventory_.FindEver(device)->told, property);
      }
    }
    return std::nullopt;
  }

 private:
  SimDeviceTree& owner_;
  std::vector<DeviceNode> devices_;
  bool ofDisks_;
};

DeviceNode SimDeviceTree::Locate(std::string_view instanceId) {
  scheduler_.Spend(kCallCost_us);
  const DeviceNode node = instanceId.empty() ? DeviceInventory::kRoot : inventory_.NodeOf(instanceId);
  return inventory_.IsThere(node) ? node : 0;
}

DeviceNode SimDeviceTree::FirstThere(const InventoryEntry& parent, std::size_t place) const {
  for (; place < parent.children.size(); ++place) {
    if (inventory_.IsThere(parent.children[place])) {
      return parent.children[place];
    }
  }
  return 0;
}

DeviceNode SimDeviceTree::Child(DeviceNode node) {
  scheduler_.Spend(kCallCost_us);
  const InventoryEntry* entry = inventory_.Find(node);
  return entry == nullptr ? 0 : FirstThere(*entry, 0);
}

DeviceNode SimDeviceTree::Sibling(DeviceNode node) {
  scheduler_.Spend(kCallCost_us);
  const InventoryEntry* entry = inventory_.Find(node);
  if (entry == nullptr || entry->parent == 0) {
    return 0;
  }
  return FirstThere(*inventory_.FindEver(entry->parent), entry->place + 1);
}

DeviceNode SimDeviceTree::Parent(DeviceNode node) {
  scheduler_.Spend(kCallCost_us);
  const InventoryEntry* entry = inventory_.Find(node);
  return entry == nullptr ? 0 : entry->parent;
}

std::optional<std::string> SimDeviceTree::InstanceId(DeviceNode node) {
  scheduler_.Spend(kCallCost_us);
  const InventoryEntry* entry = inventory_.Find(node);
  return entry == nullptr ? std::nullopt : std::optional<std::string>(entry->instanceId);
}

std::optional<DeviceProperty> SimDeviceTree::NodeProperty(DeviceNode node, std::uint32_t property) {
  scheduler_.Spend(kCallCost_us);
  const InventoryEntry* entry = inventory_.Find(node);
  constexpr std::uint32_t kShift = kNodeUiNumberProperty - kUiNumberProperty;
  return entry == nullptr || property < kShift ? std::nullopt : PropertyOf(entry->told, property - kShift);
}

std::unique_ptr<DeviceList> SimDeviceTree::Open(std::string_view enumerator, std::uint32_t flags,
                                                std::string_view interfaceClass) {
  scheduler_.Spend(kListCost_us);
  const bool byInterface = (flags & kDeviceInterfaces) != 0;
  const bool isInstance = enumerator.find('\\') != std::string_view::npos;
  const DeviceNode instance = isInstance ? inventory_.NodeOf(enumerator) : 0;
  if (byInterface ? interfaceClass.empty() || (!enumerator.empty() && instance == 0)
                  : (flags & kAllDeviceClasses) == 0 || isInstance) {
    return nullptr;
  }
  const bool ofDisks = byInterface && EqualNames(interfaceClass, kDiskInterface);
  const std::string prefix = enumerator.empty() ? std::string() : std::string(enumerator) + "\\";
  std::vector<DeviceNode> devices;
  const std::vector<InventoryEntry>& entries = inventory_.Entries();
  const auto add = [&](DeviceNode node) {
    const bool hasInterface = !byInterface || (ofDisks && !entries[node - 1].interfacePath.empty());
    if (hasInterface && ((flags & kPresentDevices) == 0 || inventory_.IsThere(node))) {
      devices.push_back(node);
    }
  };
  if (isInstance) {
    add(instance);  // there is none other to look at, however many devices there are
  } else {
    for (std::size_t i = 0; i < entries.size(); ++i) {
      if (EqualNames(std::string_view(entries[i].instanceId).substr(0, prefix.size()), prefix)) {
        add(static_cast<DeviceNode>(i + 1));
      }
    }
  }
  return std::make_unique<List>(*this, std::move(devices), ofDisks);
}

}  // namespace panelglow::platform::sim
