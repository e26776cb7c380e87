#include "platform/sim/DeviceInventory.h"

#include <algorithm>
#include <cstdio>

#include "platform/sim/base/AsciiCase.h"

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

// Everything ahead of the last backslash: what the device is, without which one of its kind it is.
std::string DeviceIdOf(const std::string& instanceId) { return instanceId.substr(0, instanceId.rfind('\\')); }

// The system's list, from the narrowest to the widest.
std::vector<std::string> PciHardwareIds(const PciFunction& function) {
  const std::uint32_t id = RegisterOf(function, kIdRegister);
  const std::uint32_t classAndRevision = RegisterOf(function, kClassRegister);
  char device[32];
  char subsystem[64];
  char number[16];
  std::snprintf(device, sizeof device, "PCI\\VEN_%04X&DEV_%04X", static_cast<unsigned>(id & 0xFFFFU),
                static_cast<unsigned>(id >> 16U));
  std::snprintf(subsystem, sizeof subsystem, "%s&SUBSYS_%08X", device,
                static_cast<unsigned>(RegisterOf(function, kSubsystemRegister)));
  std::snprintf(number, sizeof number, "&REV_%02X", static_cast<unsigned>(classAndRevision & 0xFFU));
  std::vector<std::string> ids{std::string(subsystem) + number, subsystem};
  std::snprintf(number, sizeof number, "&CC_%06X", static_cast<unsigned>(classAndRevision >> 8U));
  ids.push_back(std::string(device) + number);
  std::snprintf(number, sizeof number, "&CC_%04X", static_cast<unsigned>(classAndRevision >> 16U));
  ids.push_back(std::string(device) + number);
  return ids;
}

std::string LocationText(const PciFunction& function) {
  const unsigned location = function.location;
  char text[64];
  std::snprintf(text, sizeof text, "PCI bus %u, device %u, function %u", location >> 8U, location >> 3U & 31U,
                location & 7U);
  return text;
}

}  // namespace

std::string PciInstanceId(const PciFunction& function) {
  const std::uint32_t id = RegisterOf(function, kIdRegister);
  const auto bus = static_cast<unsigned>(function.location >> 8U);
  char way[16] = "3&11583659";  // from the host bridge on
  if (bus != 0) {
    std::snprintf(way, sizeof way, "4&%08X", bus);
  }
  char text[96];
  std::snprintf(text, sizeof text, "PCI\\VEN_%04X&DEV_%04X&SUBSYS_%08X&REV_%02X\\%s&0&%02X",
                static_cast<unsigned>(id & 0xFFFFU), static_cast<unsigned>(id >> 16U),
                static_cast<unsigned>(RegisterOf(function, kSubsystemRegister)),
                static_cast<unsigned>(RegisterOf(function, kClassRegister) & 0xFFU), way,
                unsigned{function.location} & 0xFFU);
  return text;
}

std::string DiskInterfacePath(const std::string& instanceId) {
  std::string path = Lowered(instanceId);
  std::replace(path.begin(), path.end(), '\\', '#');
  return "\\\\?\\" + path + "#{" + Lowered(kDiskInterface) + "}";
}

DeviceInventory::DeviceInventory(const MachineDescription& machine, std::function<bool(const std::string&)> isThere)
    : isThere_(std::move(isThere)) {
  Add(0, {.instanceId = "HTREE\\ROOT\\0"});
  const DeviceNode bridge = Add(kRoot, {.instanceId = "ACPI\\PNP0A08\\0",
                                        .description = "PCI Express Root Complex",
                                        .hardwareIds = {"ACPI\\PNP0A08", "*PNP0A08"},
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
                 .description = device.description,
                 .hardwareIds = device.hardwareIds,
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
    entry.driverKey = entry.classId + number;
  }
  if (entry.hardwareIds.empty()) {
    entry.hardwareIds = {DeviceIdOf(entry.instanceId)};
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
      node = Add(
          bridge,
          {.instanceId = PciInstanceId(*function), .description = function->description, .classId = kSystemClass});
    }
    entries_[node - 1].hardwareIds = PciHardwareIds(*function);
    entries_[node - 1].location = LocationText(*function);
  }
}

DeviceNode DeviceInventory::AddController(const MachineDescription& machine, const ControllerDescription& controller,
                                          DeviceNode parent) {
  const DeviceNode node =
      Add(parent, {.instanceId = controller.instanceId,
                   .description = controller.description,
                   .classId = controller.kind == ControllerDescription::Kind::kIde ? kIdeClass : kScsiClass,
                   .uiNumber = controller.uiNumber});
  for (const DiskSetup& disk : machine.disks) {
    if (disk.controller == controller.name) {
      Add(node, {.instanceId = disk.instanceId,
                 .description = disk.description,
                 .hardwareIds = {DeviceIdOf(disk.instanceId), "GenDisk"},
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
