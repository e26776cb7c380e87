#include "platform/sim/DeviceTables.h"

#include "platform/AsciiCase.h"
#include "platform/management/DeviceRows.h"
#include "platform/sim/DeviceInventory.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint32_t kDisplayClass = 0x03;
constexpr std::uint16_t kClassRegister = 0x08;

using management::RowOfDevice;
using management::SetText;

}  // namespace

std::optional<std::vector<ManagementRow>> DeviceTables::Rows(std::string_view className) const {
  const std::string name = Lowered(className);
  if (name == "win32_idecontroller") {
    return Controllers(ControllerDescription::Kind::kIde);
  }
  if (name == "win32_scsicontroller") {
    return Controllers(ControllerDescription::Kind::kScsi);
  }
  if (name == "win32_diskdrive") {
    return Disks();
  }
  if (name == "win32_videocontroller") {
    return VideoControllers();
  }
  if (name == "win32_processor") {
    return Processors();
  }
  return std::nullopt;
}

std::optional<std::vector<ManagementRow>> DeviceTables::Associated(const management::WqlQuery& query) const {
  if (!EqualNames(query.className, "Win32_PnPEntity") || !EqualNames(query.condition->property, "DeviceID")) {
    return std::nullopt;
  }
  for (const ControllerDescription& controller : machine_.controllers) {
    if (!EqualNames(controller.instanceId, query.condition->value)) {
      continue;
    }
    std::vector<ManagementRow> rows;
    if (EqualNames(query.resultClass, "Win32_SystemDriver") && !controller.driver.empty()) {
      SetText(rows.emplace_back(), u"Name", controller.driver);
    }
    return rows;
  }
  return std::nullopt;
}

std::vector<ManagementRow> DeviceTables::Controllers(ControllerDescription::Kind kind) const {
  std::vector<ManagementRow> rows;
  for (const ControllerDescription& controller : machine_.controllers) {
    if (controller.kind != kind) {
      continue;
    }
    ManagementRow& row = rows.emplace_back(RowOfDevice(controller.instanceId, controller.description));
    if (kind == ControllerDescription::Kind::kScsi) {  // the other class has no such property
      SetText(row, u"DriverName", controller.driver);
    }
  }
  return rows;
}

std::vector<ManagementRow> DeviceTables::Disks() const {
  std::vector<ManagementRow> rows;
  for (const DiskSetup& disk : machine_.disks) {
    if (disk.interfacePath.empty() || !isThere_(disk.name)) {
      continue;
    }
    ManagementRow& row = rows.emplace_back(RowOfDevice(disk.instanceId, disk.description));
    SetText(row, u"DeviceID", disk.path);
    SetText(row, u"Name", disk.path);
    SetText(row, u"Model", disk.description);
    SetText(row, u"Size", std::to_string(disk.size_bytes));
  }
  return rows;
}

std::vector<ManagementRow> DeviceTables::VideoControllers() const {
  std::vector<ManagementRow> rows;
  for (const PciFunction& function : machine_.pci) {
    const auto code = function.registers.find(kClassRegister);
    if (code != function.registers.end() && code->second >> 24U == kDisplayClass) {
      ManagementRow& row = rows.emplace_back(RowOfDevice(PciInstanceId(function), "Video controller"));
      SetText(row, u"DeviceID", "VideoController" + std::to_string(rows.size()));
    }
  }
  return rows;
}

std::vector<ManagementRow> DeviceTables::Processors() const {
  std::vector<ManagementRow> rows;
  for (const ProcessorDescription& processor : machine_.firmware.processors) {
    ManagementRow& row = rows.emplace_back();
    SetText(row, u"DeviceID", "CPU" + std::to_string(rows.size() - 1));
    SetText(row, u"Manufacturer", processor.manufacturer);
  }
  return rows;
}

}  // namespace panelglow::platform::sim
