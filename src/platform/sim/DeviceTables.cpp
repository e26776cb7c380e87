#include "platform/sim/DeviceTables.h"

#include <type_traits>
#include <variant>

#include "platform/Text.h"
#include "platform/sim/DeviceInventory.h"
#include "platform/sim/base/AsciiCase.h"

namespace panelglow::platform::sim {

namespace {

constexpr std::uint32_t kDisplayClass = 0x03;
constexpr std::uint16_t kClassRegister = 0x08;

void SetText(ManagementRow& row, std::u16string_view property, std::string_view text) {
  row.Set(property, {ManagementScalar(WideFromUtf8(text))});
}

ManagementRow RowOfDevice(const std::string& instanceId, const std::string& description) {
  ManagementRow row;
  SetText(row, u"PNPDeviceID", instanceId);
  SetText(row, u"DeviceID", instanceId);
  SetText(row, u"Description", description);
  SetText(row, u"Name", description);
  return row;
}

// A value as a condition compares it; nothing for a null and for a list.
std::optional<std::string> TextOf(const ManagementValue* value) {
  const ManagementScalar* scalar = value == nullptr ? nullptr : std::get_if<ManagementScalar>(&value->content);
  if (scalar == nullptr) {
    return std::nullopt;
  }
  return std::visit(
      [](const auto& content) -> std::optional<std::string> {
        using Content = std::decay_t<decltype(content)>;
        if constexpr (std::is_same_v<Content, std::monostate>) {
          return std::nullopt;
        } else if constexpr (std::is_same_v<Content, wstring>) {
          return Utf8FromWide(content);
        } else if constexpr (std::is_same_v<Content, bool>) {
          return content ? "true" : "false";
        } else {
          return std::to_string(content);
        }
      },
      *scalar);
}

}  // namespace

bool Fulfils(const ManagementRow& row, const WqlCondition& condition) {
  const std::optional<std::string> value = TextOf(row.Find(WideFromUtf8(condition.property)));
  return value && EqualNames(*value, condition.value);
}

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

std::optional<std::vector<ManagementRow>> DeviceTables::Associated(const WqlQuery& query) const {
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
