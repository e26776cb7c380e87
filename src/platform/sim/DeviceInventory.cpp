#include "platform/sim/DeviceInventory.h"

#include <algorithm>
#include <cstdio>

#include "platform/AsciiCase.h"
#include "platform/DeviceIds.h"

namespace panelglow::platform::sim {

namespace {

// Set-up classes.
constexpr const char* kIdeClass = "{4d36e96a-e325-11ce-bfc1-08002be10318}";
constexpr const char* kScsiClass = "{4d36e97b-e325-11ce-bfc1-08002be10318}";
constexpr const char* kDiskClass = "{4d36e967-e325-11ce-bfc1-08002be10318}";
constexpr const char* kSystemClass = "{4d36e97d-e325-11ce-bfc1-08002be10318}";

constexpr std::uint16_t kIdRegister = 0x00;
constexpr std::uint16_t kClassRegister = 0x08;
constexpr std::uint16_t kSubsystemRegister = 0x2C;

std::uint32_t RegisterOf(const PciFunction& function, std::uint16_t offset) {
  const auto found = function.registers.find(offset);
  return found == function.registers.end() ? 0 : found->second;
}

PciFunctionIds IdentityOf(const PciFunction& function) {
  const std::uint32_t id = RegisterOf(function, kIdRegister);
  const std::uint32_t subsystem = RegisterOf(function, kSubsystemRegister);
  const std::uint32_t classAndRevision = RegisterOf(function, kClassRegister);
  return {.vendorId = static_cast<std::uint16_t>(id),
          .deviceId = static_cast<std::uint16_t>(id >> 16U),
          .subVendorId = static_cast<std::uint16_t>(subsystem),
          .subDeviceId = static_cast<std::uint16_t>(subsystem >> 16U),
          .classCode = classAndRevision >> 8U,
          .revision = static_cast<std::uint8_t>(classAndRevision)};
}

}  // namespace

std::string PciInstanceId(const PciFunction& function) {
  return platform::PciInstanceId(IdentityOf(function), function.location);
}

DeviceInventory::DeviceInventory(const MachineDescription& machine, std::function<bool(const std::string&)> isThere)
    : isThere_(std::move(isThere)) {
  Add(0, {.instanceId = "HTREE\\ROOT\\0"});
  const DeviceNode bridge =
      Add(kRoot, {.instanceId = "ACPI\\PNP0A08\\0",
                  .told = {.description = "PCI Express Root Complex", .hardwareIds = {"ACPI\\PNP0A08", "*PNP0A08"}},
                  .classId = kSystemClass});
  AddPciFunctions(machine, bridge);
  for (const ControllerDescription& controller : machine.controllers) {
    if (NodeOf(controller.instanceId) == 0) {
      const bool isPci = EqualNames(controller.instanceId.substr(0, 4), "PCI\\");
      AddController(machine, controller, isPci ? bridge : kRoot);
    }
  }
  for (const EnumeratedDescription& device : machine.enumerated) {
    const DeviceNode parent = device.parent.empty() ? kRoot : NodeOf(device.parent);
    if (parent == 0) {
      throw MachineError("the device " + device.instanceId + " hangs on " + device.parent +
                         ", which is no device of this machine ahead of it");
    }
    Add(parent, {.instanceId = device.instanceId,
                 .told = {.description = device.description, .hardwareIds = device.hardwareIds},
                 .classId = kSystemClass});
  }
}

DeviceNode DeviceInventory::Add(DeviceNode parent, InventoryEntry entry) {
  const auto node = static_cast<DeviceNode>(entries_.size() + 1);
  if (!nodes_.emplace(Lowered(entry.instanceId), node).second) {
    throw MachineError("two devices have the instance id " + entry.instanceId);
  }
  if (!entry.classId.empty()) {
    char number[16];
    std::snprintf(number, sizeof number, "\\%04u", drivers_[entry.classId]++);
    entry.told.driverKey = entry.classId + number;
  }
  if (entry.told.hardwareIds.empty()) {
    entry.told.hardwareIds = {DeviceIdOf(entry.instanceId)};
  }
  entry.parent = parent;
  if (parent != 0) {
    std::vector<DeviceNode>& siblings = entries_[parent - 1].children;
    entry.place = siblings.size();
    siblings.push_back(node);
  }
  entries_.push_back(std::move(entry));
  return node;
}

void DeviceInventory::AddPciFunctions(const MachineDescription& machine, DeviceNode bridge) {
  std::vector<const PciFunction*> functions;
  for (const PciFunction& function : machine.pci) {
    functions.push_back(&function);
  }
  std::stable_sort(functions.begin(), functions.end(),
                   [](const PciFunction* one, const PciFunction* other) { return one->location < other->location; });
  for (const PciFunction* function : functions) {
    const auto controller =
        std::find_if(machine.controllers.begin(), machine.controllers.end(), [&](const ControllerDescription& c) {
          return c.instanceId == function->controller && !c.instanceId.empty();
        });
    DeviceNode node = 0;
    if (controller != machine.controllers.end()) {
      node = AddController(machine, *controller, bridge);
    } else {
      node = Add(bridge, {.instanceId = PciInstanceId(*function),
                          .told = {.description = function->description},
                          .classId = kSystemClass});
    }
    entries_[node - 1].told.hardwareIds = PciHardwareIds(IdentityOf(*function));
    entries_[node - 1].told.location = PciLocationText(function->location);
  }
}

DeviceNode DeviceInventory::AddController(const MachineDescription& machine, const ControllerDescription& controller,
                                          DeviceNode parent) {
  const DeviceNode node =
      Add(parent, {.instanceId = controller.instanceId,
                   .told = {.description = controller.description, .uiNumber = controller.uiNumber},
                   .classId = controller.kind == ControllerDescription::Kind::kIde ? kIdeClass : kScsiClass});
  for (const DiskSetup& disk : machine.disks) {
    if (disk.controller == controller.name) {
      Add(node, {.instanceId = disk.instanceId,
                 .told = {.description = disk.description, .hardwareIds = {DeviceIdOf(disk.instanceId), "GenDisk"}},
                 .classId = kDiskClass,
                 .interfacePath = disk.interfacePath,
                 .device = disk.name});
    }
  }
  return node;
}

const InventoryEntry* DeviceInventory::FindEver(DeviceNode node) const {
  return node == 0 || node > entries_.size() ? nullptr : &entries_[node - 1];
}

const InventoryEntry* DeviceInventory::Find(DeviceNode node) const {
  const InventoryEntry* entry = FindEver(node);
  return entry == nullptr || entry->device.empty() || isThere_(entry->device) ? entry : nullptr;
}

DeviceNode DeviceInventory::NodeOf(std::string_view instanceId) const {
  const auto found = nodes_.find(Lowered(instanceId));
  return found == nodes_.end() ? 0 : found->second;
}

}  // namespace panelglow::platform::sim
