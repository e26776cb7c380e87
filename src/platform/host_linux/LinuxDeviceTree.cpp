#include "platform/host_linux/LinuxDeviceTree.h"

#include <algorithm>
#include <utility>

#include "platform/AsciiCase.h"
#include "platform/host_linux/ClassNames.h"
#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/StorageInventory.h"

namespace panelglow::platform::host_linux {

// The devices as they were when the list was opened.
class LinuxDeviceTree::List : public DeviceList {
 public:
  struct Item {
    DeviceNode device = 0;
    DeviceDescription told = {};
    std::string interfacePath = {};
  };

  List(std::vector<Item> items, bool ofDisks) : items_(std::move(items)), ofDisks_(ofDisks) {}

  std::optional<DeviceNode> Device(std::uint32_t index) override {
    CurrentThread::CheckEndRequest();
    return index < items_.size() ? std::optional<DeviceNode>(items_[index].device) : std::nullopt;
  }

  // A device has one interface of a class at most, and is in an interface list only with it.
  std::optional<DeviceInterface> Interface(std::uint32_t index) override {
    CurrentThread::CheckEndRequest();
    if (!ofDisks_ || index >= items_.size()) {
      return std::nullopt;
    }
    return DeviceInterface{items_[index].interfacePath, items_[index].device};
  }

  std::optional<DeviceProperty> Property(DeviceNode device, std::uint32_t property) override {
    CurrentThread::CheckEndRequest();
    const auto found =
        std::find_if(items_.begin(), items_.end(), [device](const Item& item) { return item.device == device; });
    return found == items_.end() ? std::nullopt : PropertyOf(found->told, property);
  }

 private:
  std::vector<Item> items_;
  bool ofDisks_;
};

// ---- the look at the machine

void LinuxDeviceTree::Look() {
  const PciInventory pci(folders_);
  const StorageInventory storage(folders_, pci);
  for (Entry& entry : entries_) {
    entry.isThere = false;
    entry.children.clear();
  }
  order_.clear();
  const DeviceNode root = Note(0, "HTREE\\ROOT\\0", {}, {});
  const DeviceNode hostBridge = Note(
      root, "ACPI\\PNP0A08\\0",
      {.description = "PCI Express Root Complex", .hardwareIds = {"ACPI\\PNP0A08", "*PNP0A08"}, .driverKey = "pci"},
      {});
  std::vector<DeviceNode> functions;  // by place in the list
  for (const SysfsPciFunction& function : pci.Functions()) {
    const DeviceNode parent =
        function.parent && *function.parent < functions.size() ? functions[*function.parent] : hostBridge;
    functions.push_back(Note(parent, PciInstanceId(function.identity, function.location),
                             {.description = DescriptionOf(function.identity),
                              .hardwareIds = PciHardwareIds(function.identity),
                              .driverKey = function.driver,
                              .location = PciLocationText(function.location),
                              .uiNumber = function.slotNumber},
                             {}));
  }
  for (const SysfsDisk& disk : storage.Disks()) {
    DeviceNode parent = disk.owner ? functions[*disk.owner] : root;
    if (!disk.cardId.empty()) {
      parent = Note(parent, disk.cardId, {.description = kCardName, .hardwareIds = {DeviceIdOf(disk.cardId)}}, {});
    }
    Note(parent, disk.instanceId,
         {.description = disk.model, .hardwareIds = {DeviceIdOf(disk.instanceId), "GenDisk"}, .driverKey = "disk"},
         DiskInterfacePath(disk.instanceId));
  }
  for (const std::string& drive : storage.FloppyDrives()) {
    Note(root, drive, {.description = "Floppy disk drive", .hardwareIds = {DeviceIdOf(drive)}, .driverKey = "floppy"},
         {});
  }
}

DeviceNode LinuxDeviceTree::Note(DeviceNode parent, std::string instanceId, DeviceDescription told,
                                 std::string interfacePath) {
  const auto [known, isNew] = nodes_.emplace(Lowered(instanceId), static_cast<DeviceNode>(entries_.size() + 1));
  const DeviceNode node = known->second;
  if (isNew) {
    entries_.emplace_back();
  }
  Entry& entry = entries_[node - 1];
  entry.instanceId = std::move(instanceId);
  entry.told = std::move(told);
  entry.interfacePath = std::move(interfacePath);
  entry.isThere = true;
  entry.parent = parent;
  order_.push_back(node);
  if (parent != 0) {
    std::vector<DeviceNode>& siblings = entries_[parent - 1].children;
    entry.place = siblings.size();
    siblings.push_back(node);
  }
  return node;
}

// ---- questions

const LinuxDeviceTree::Entry* LinuxDeviceTree::Find(DeviceNode node) const {
  return node == 0 || node > entries_.size() || !entries_[node - 1].isThere ? nullptr : &entries_[node - 1];
}

DeviceNode LinuxDeviceTree::NodeOf(std::string_view instanceId) const {
  const auto found = nodes_.find(Lowered(instanceId));
  return found == nodes_.end() || Find(found->second) == nullptr ? 0 : found->second;
}

DeviceNode LinuxDeviceTree::ChildAt(const Entry& parent, std::size_t place) const {
  return place < parent.children.size() ? parent.children[place] : 0;
}

DeviceNode LinuxDeviceTree::Locate(std::string_view instanceId) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(guard_);
  Look();
  return instanceId.empty() ? order_.front() : NodeOf(instanceId);
}

DeviceNode LinuxDeviceTree::Child(DeviceNode node) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(guard_);
  const Entry* const entry = Find(node);
  return entry == nullptr ? 0 : ChildAt(*entry, 0);
}

DeviceNode LinuxDeviceTree::Sibling(DeviceNode node) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(guard_);
  const Entry* const entry = Find(node);
  const Entry* const parent = entry == nullptr ? nullptr : Find(entry->parent);
  return parent == nullptr ? 0 : ChildAt(*parent, entry->place + 1);
}

DeviceNode LinuxDeviceTree::Parent(DeviceNode node) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(guard_);
  const Entry* const entry = Find(node);
  return entry == nullptr ? 0 : entry->parent;
}

std::optional<std::string> LinuxDeviceTree::InstanceId(DeviceNode node) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(guard_);
  const Entry* const entry = Find(node);
  return entry == nullptr ? std::nullopt : std::optional<std::string>(entry->instanceId);
}

std::optional<DeviceProperty> LinuxDeviceTree::NodeProperty(DeviceNode node, std::uint32_t property) {
  CurrentThread::CheckEndRequest();
  const std::lock_guard<std::mutex> lock(guard_);
  const Entry* const entry = Find(node);
  constexpr std::uint32_t kShift = kNodeUiNumberProperty - kUiNumberProperty;
  return entry == nullptr || property < kShift ? std::nullopt : PropertyOf(entry->told, property - kShift);
}

// Only what is there is known, so that a list of devices that have gone is the same one.
std::unique_ptr<DeviceList> LinuxDeviceTree::Open(std::string_view enumerator, std::uint32_t flags,
                                                  std::string_view interfaceClass) {
  CurrentThread::CheckEndRequest();
  const bool byInterface = (flags & kDeviceInterfaces) != 0;
  const bool isInstance = enumerator.find('\\') != std::string_view::npos;
  const std::lock_guard<std::mutex> lock(guard_);
  Look();
  if (byInterface ? interfaceClass.empty() || (!enumerator.empty() && NodeOf(enumerator) == 0)
                  : (flags & kAllDeviceClasses) == 0 || isInstance) {
    return nullptr;
  }
  const bool ofDisks = byInterface && EqualNames(interfaceClass, kDiskInterface);
  const std::string prefix = enumerator.empty() ? std::string() : std::string(enumerator) + "\\";
  std::vector<List::Item> items;
  for (const DeviceNode node : order_) {
    const Entry& entry = entries_[node - 1];
    const bool isMeant = isInstance ? EqualNames(entry.instanceId, enumerator)
                                    : EqualNames(std::string_view(entry.instanceId).substr(0, prefix.size()), prefix);
    if (isMeant && (!byInterface || (ofDisks && !entry.interfacePath.empty()))) {
      items.push_back({node, entry.told, entry.interfacePath});
    }
  }
  return std::make_unique<List>(std::move(items), ofDisks);
}

}  // namespace panelglow::platform::host_linux
