#include "platform/sim/DeviceReader.h"

#include <algorithm>

#include "platform/AsciiCase.h"
#include "platform/DeviceIds.h"
#include "platform/sim/DeviceInventory.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint32_t kAhciClass = 0x010601;
constexpr std::uint32_t kSasClass = 0x010700;
constexpr std::uint64_t kDefaultDiskBytes = 0x40000000;
constexpr std::uint32_t kDefaultLatency_us = 2000;
constexpr std::uint32_t kDefaultGlow_us = 30'000;
constexpr std::uint32_t kDefaultBuild_ms = 300;
constexpr std::uint32_t kDefaultLink_ms = 50;
constexpr std::uint8_t kMostPorts = 8;

Microseconds Milliseconds(Section& section, std::string_view key, std::uint32_t fallback) {
  return Microseconds{section.Get<std::uint32_t>(key, fallback)} * 1000;
}

std::optional<Microseconds> GoneAt(Section& section) {
  return section.Has("gone_ms") ? std::optional<Microseconds>(Milliseconds(section, "gone_ms", 0)) : std::nullopt;
}

// A LED names its part; so no two parts may have one name.
std::string PartName(Section& section, const MachineDescription& machine) {
  std::string name = section.Required("name");
  const auto holds = [&name](const auto& parts) {
    return std::any_of(parts.begin(), parts.end(), [&name](const auto& part) { return part.name == name; });
  };
  if (name == "keyboard" || name == "firmware" || holds(machine.chips) || holds(machine.disks) ||
      holds(machine.cameras) || holds(machine.adapters)) {
    section.Refuse("name", "is the name of another part");
  }
  return name;
}

std::string InstanceId(Section& section) {
  std::string id = section.Required("id");
  const std::size_t first = id.find('\\');
  if (first == std::string::npos || first == 0 || first + 1 == id.size()) {
    section.Refuse("id", "must be an instance id: an enumerator, a backslash, the device");
  }
  return id;
}

void AddPciFunction(Section& section, const ControllerDescription& controller, MachineDescription& machine) {
  const std::optional<PciIdentity> identity = ParsePciInstanceId(controller.instanceId);
  if (!identity) {
    return;  // an id that only the system's lists know
  }
  PciFunction function;
  function.location = static_cast<std::uint16_t>(controller.bus << 8U | identity->place);
  function.controller = controller.instanceId;
  function.registers[0x00] = static_cast<std::uint32_t>(identity->device) << 16U | identity->vendor;
  function.registers[0x08] = controller.classCode << 8U | identity->revision;
  function.registers[0x2C] = identity->subsystem;
  if (std::any_of(machine.pci.begin(), machine.pci.end(),
                  [&](const PciFunction& other) { return other.location == function.location; })) {
    section.Refuse("id", "ends in the place of another PCI function");
  }
  machine.pci.push_back(std::move(function));
}

void ReadController(Section& section, MachineDescription& machine) {
  constexpr std::array<std::string_view, 2> kKinds{"ide", "scsi"};
  ControllerDescription controller;
  controller.name = section.Required("name");
  if (std::any_of(machine.controllers.begin(), machine.controllers.end(),
                  [&](const ControllerDescription& other) { return other.name == controller.name; })) {
    section.Refuse("name", "is the name of another controller");
  }
  controller.instanceId = InstanceId(section);
  controller.kind = static_cast<ControllerDescription::Kind>(section.OneOf("kind", kKinds));
  controller.classCode = section.Get<std::uint32_t>(
      "class", controller.kind == ControllerDescription::Kind::kIde ? kAhciClass : kSasClass);
  if (controller.classCode > 0xFFFFFF) {
    section.Refuse("class", "must have 24 bits");
  }
  controller.bus = section.Get("bus", controller.bus);
  controller.description = section.Get<std::string>("description", "Storage controller");
  controller.driver = section.Get<std::string>("driver", "");
  controller.scsiPorts = section.Bytes("scsi_ports");
  if (std::any_of(controller.scsiPorts.begin(), controller.scsiPorts.end(),
                  [](std::uint8_t port) { return port >= kMostPorts; })) {
    section.Refuse("scsi_ports", "must be 0 to 7 each");
  }
  if (section.Has("ui_number")) {
    controller.uiNumber = section.Number<std::uint32_t>("ui_number");
  }
  AddPciFunction(section, controller, machine);
  machine.controllers.push_back(std::move(controller));
}

void ReadDisk(Section& section, MachineDescription& machine) {
  constexpr std::array<std::string_view, 5> kFaults{"", "no-open", "read-error", "write-error", "slow"};
  DiskSetup disk;
  disk.name = PartName(section, machine);
  disk.controller = section.Required("controller");
  if (std::none_of(machine.controllers.begin(), machine.controllers.end(),
                   [&](const ControllerDescription& controller) { return controller.name == disk.controller; })) {
    section.Refuse("controller", "names no [[controller]]");
  }
  disk.instanceId = InstanceId(section);
  disk.interfacePath = section.Get<std::string>("interface_path", DiskInterfacePath(disk.instanceId));
  const auto drives = std::count_if(machine.disks.begin(), machine.disks.end(),
                                    [](const DiskSetup& other) { return !other.interfacePath.empty(); });
  disk.path = section.Get<std::string>(
      "path", disk.interfacePath.empty() ? "" : "\\\\.\\PHYSICALDRIVE" + std::to_string(drives));
  disk.description = section.Get<std::string>("description", "Disk drive");
  disk.file = section.Get<std::string>("file", "");
  disk.size_bytes = section.Get<std::uint64_t>("size", kDefaultDiskBytes);
  disk.latency_us = section.Get<std::uint32_t>("latency_us", kDefaultLatency_us);
  disk.glow_us = section.Get<std::uint32_t>("glow_us", kDefaultGlow_us);
  disk.fault = static_cast<DiskSetup::Fault>(section.OneOf("fault", kFaults));
  disk.goneAt = GoneAt(section);
  machine.disks.push_back(std::move(disk));
}

void ReadCamera(Section& section, MachineDescription& machine) {
  CameraSetup camera;
  camera.name = PartName(section, machine);
  camera.build_us = Milliseconds(section, "build_ms", kDefaultBuild_ms);
  if (const std::size_t fault = section.OneOf("fault", kCaptureFaults); fault != 0) {
    camera.fault = static_cast<CaptureStep>(fault - 1);
  }
  camera.goneAt = GoneAt(section);
  machine.cameras.push_back(std::move(camera));
}

void ReadAdapter(Section& section, MachineDescription& machine) {
  constexpr std::array<std::string_view, 4> kFaults{"", "stays-down", "stays-up", "no-properties"};
  AdapterSetup adapter;
  adapter.name = PartName(section, machine);
  adapter.deviceName = section.Required("device_name");
  adapter.isUp = section.Get("up", adapter.isUp);
  adapter.disconnect_us = Milliseconds(section, "disconnect_ms", kDefaultLink_ms);
  adapter.connect_us = Milliseconds(section, "connect_ms", kDefaultLink_ms);
  adapter.fault = static_cast<AdapterSetup::Fault>(section.OneOf("fault", kFaults));
  machine.adapters.push_back(std::move(adapter));
}

void ReadEnumerated(Section& section, MachineDescription& machine) {
  EnumeratedDescription device;
  device.instanceId = InstanceId(section);
  device.hardwareIds = section.Names("hardware_ids");
  device.description = section.Get<std::string>("description", "Device");
  device.parent = section.Get<std::string>("parent", "");
  machine.enumerated.push_back(std::move(device));
}

}  // namespace

void ReadDevices(Section& root, MachineDescription& machine) {
  root.Each("controller", [&](Section& section) { ReadController(section, machine); });
  root.Each("disk", [&](Section& section) { ReadDisk(section, machine); });
  root.Each("camera", [&](Section& section) { ReadCamera(section, machine); });
  root.Each("adapter", [&](Section& section) { ReadAdapter(section, machine); });
  root.Each("enumerated", [&](Section& section) { ReadEnumerated(section, machine); });
  machine.libraries = root.Names("libraries");
}

}  // namespace panelglow::platform::sim
