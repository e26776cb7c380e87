#include "platform/host_linux/LinuxManagement.h"

#include <algorithm>
#include <array>
#include <set>
#include <string>

#include "platform/AsciiCase.h"
#include "platform/host_linux/ClassNames.h"
#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/FirmwareTables.h"
#include "platform/host_linux/StorageInventory.h"
#include "platform/management/DeviceRows.h"
#include "platform/management/WqlQuery.h"

namespace panelglow::platform::host_linux {

namespace {

using management::RowOfDevice;
using management::SetText;

using Rows = std::vector<ManagementRow>;

ManagementRow RowOfFunction(const SysfsPciFunction& function) {
  return RowOfDevice(PciInstanceId(function.identity, function.location), DescriptionOf(function.identity));
}

Rows Controllers(const KernelFolders& folders, ControllerKind kind) {
  const PciInventory pci(folders);
  const auto ports = ScsiPortDrivers(folders, pci);
  Rows rows;
  for (std::size_t place = 0; place < pci.Functions().size(); ++place) {
    if (ControllerKindOf(pci.Functions()[place].identity) != kind) {
      continue;
    }
    const std::string driver = ControllerDriver(ports, pci, place);
    if (kind == ControllerKind::kScsi && driver.empty()) {
      continue;  // nobody drives it, and an empty name would be found to be another controller's
    }
    ManagementRow& row = rows.emplace_back(RowOfFunction(pci.Functions()[place]));
    if (kind == ControllerKind::kScsi) {  // the other class has no such property
      SetText(row, u"DriverName", driver);
    }
  }
  return rows;
}

Rows IdeControllers(const KernelFolders& folders) { return Controllers(folders, ControllerKind::kIde); }

// Memory cards stand for controllers of their own here.
Rows ScsiControllers(const KernelFolders& folders) {
  Rows rows = Controllers(folders, ControllerKind::kScsi);
  const PciInventory pci(folders);
  const StorageInventory storage(folders, pci);
  for (const SysfsDisk& disk : storage.Disks()) {
    if (!disk.cardId.empty()) {
      rows.push_back(RowOfDevice(disk.cardId, kCardName));
    }
  }
  return rows;
}

Rows DiskDrives(const KernelFolders& folders) {
  const PciInventory pci(folders);
  const StorageInventory storage(folders, pci);
  Rows rows;
  for (const SysfsDisk& disk : storage.Disks()) {
    ManagementRow& row = rows.emplace_back(RowOfDevice(disk.instanceId, disk.model));
    const std::string file = DiskFileOf(folders, DiskInterfacePath(disk.instanceId));
    SetText(row, u"DeviceID", file);
    SetText(row, u"Name", file);
    SetText(row, u"Model", disk.model);
    SetText(row, u"SerialNumber", disk.serialNumber);
    SetText(row, u"Size", std::to_string(disk.size_bytes));
  }
  return rows;
}

Rows VideoControllers(const KernelFolders& folders) {
  constexpr std::uint32_t kDisplay = 0x03;
  const PciInventory pci(folders);
  Rows rows;
  for (const SysfsPciFunction& function : pci.Functions()) {
    if (function.identity.classCode >> 16U == kDisplay) {
      ManagementRow& row = rows.emplace_back(RowOfFunction(function));
      SetText(row, u"DeviceID", "VideoController" + std::to_string(rows.size()));
    }
  }
  return rows;
}

// A field of the first processor in the kernel's list; empty on a machine whose list has no such field.
std::string FirstProcessorField(const std::string& list, std::string_view name) {
  std::size_t begin = 0;
  while (begin < list.size()) {
    const std::size_t end = std::min(list.find('\n', begin), list.size());
    const std::string_view line = std::string_view(list).substr(begin, end - begin);
    const std::size_t colon = line.find(':');
    if (colon != std::string_view::npos && line.substr(0, name.size()) == name &&
        line.find_first_not_of(" \t", name.size()) == colon) {
      const std::size_t value = line.find_first_not_of(" \t", colon + 1);
      return value == std::string_view::npos ? std::string() : std::string(line.substr(value));
    }
    begin = end + 1;
  }
  return {};
}

// One for each package, whose cores the kernel shows one by one.
Rows Processors(const KernelFolders& folders) {
  constexpr std::uint64_t kMostPackages = 0xFFFF;
  constexpr std::size_t kOneProcessor_bytes = 16384;
  std::set<std::uint64_t> packages;
  const std::string processors = folders.sys + "/devices/system/cpu/";
  for (const std::string& name : KernelNames(processors)) {
    if (name.compare(0, 3, "cpu") == 0) {
      if (const auto package = ReadKernelNumber(processors + name + "/topology/physical_package_id", kMostPackages)) {
        packages.insert(*package);
      }
    }
  }
  const std::string list =
      packages.empty() ? std::string() : ReadKernelBytes(folders.proc + "/cpuinfo", kOneProcessor_bytes).value_or("");
  Rows rows;
  while (rows.size() < packages.size()) {
    ManagementRow& row = rows.emplace_back();
    SetText(row, u"DeviceID", "CPU" + std::to_string(rows.size() - 1));
    SetText(row, u"Manufacturer", FirstProcessorField(list, "vendor_id"));
    SetText(row, u"Name", FirstProcessorField(list, "model name"));
  }
  return rows;
}

Rows FirmwareTable(const KernelFolders& folders) {
  const std::vector<std::uint8_t> table = ReadFirmwareTable(folders);
  return table.empty() ? Rows() : Rows{management::FirmwareTableRow(table)};
}

struct Class {
  std::string_view nameSpace;
  std::string_view name;
  Rows (*rows)(const KernelFolders&);
};
constexpr std::array kClasses{Class{management::kDeviceNameSpace, "Win32_IDEController", IdeControllers},
                              Class{management::kDeviceNameSpace, "Win32_SCSIController", ScsiControllers},
                              Class{management::kDeviceNameSpace, "Win32_DiskDrive", DiskDrives},
                              Class{management::kDeviceNameSpace, "Win32_VideoController", VideoControllers},
                              Class{management::kDeviceNameSpace, "Win32_Processor", Processors},
                              Class{management::kFirmwareNameSpace, "MSSmBios_RawSMBiosTables", FirmwareTable}};

// The driver of a PCI function: the only association that there is. Nothing when there is no such function.
std::optional<Rows> Associated(const KernelFolders& folders, const management::WqlQuery& query) {
  if (!EqualNames(query.className, "Win32_PnPEntity") || !query.condition ||
      !EqualNames(query.condition->property, "DeviceID")) {
    return std::nullopt;
  }
  const PciInventory pci(folders);
  for (std::size_t place = 0; place < pci.Functions().size(); ++place) {
    const SysfsPciFunction& function = pci.Functions()[place];
    if (!EqualNames(PciInstanceId(function.identity, function.location), query.condition->value)) {
      continue;
    }
    Rows rows;
    const std::string driver = ControllerDriver(ScsiPortDrivers(folders, pci), pci, place);
    if (EqualNames(query.resultClass, "Win32_SystemDriver") && !driver.empty()) {
      SetText(rows.emplace_back(), u"Name", driver);
    }
    return rows;
  }
  return std::nullopt;
}

class LinuxConnection : public ManagementConnection {
 public:
  LinuxConnection(const KernelFolders& folders, std::string nameSpace)
      : folders_(folders), nameSpace_(std::move(nameSpace)) {}

  std::optional<Rows> Query(std::u16string_view text) override {
    CurrentThread::CheckEndRequest();
    const std::optional<management::WqlQuery> query = management::ParseWql(Utf8FromWide(text));
    if (!query) {
      return std::nullopt;
    }
    if (!query->resultClass.empty()) {
      return nameSpace_ == management::kDeviceNameSpace ? Associated(folders_, *query) : std::nullopt;
    }
    const auto* const found = std::find_if(kClasses.begin(), kClasses.end(), [&](const Class& candidate) {
      return candidate.nameSpace == nameSpace_ && EqualNames(candidate.name, query->className);
    });
    if (found == kClasses.end()) {
      return std::nullopt;
    }
    Rows rows = found->rows(folders_);
    if (query->condition) {
      std::erase_if(rows, [&](const ManagementRow& row) { return !management::Fulfils(row, *query->condition); });
    }
    return rows;
  }

  ManagementCallResult Call(const ManagementCall& /*call*/) override {
    CurrentThread::CheckEndRequest();
    return {ManagementCallStep::kGetMethod, {}};  // the class does not exist here
  }

 private:
  const KernelFolders folders_;
  const std::string nameSpace_;  // lowered
};

}  // namespace

std::unique_ptr<ManagementConnection> LinuxManagement::Connect(std::string_view nameSpace, ManagementError& error) {
  CurrentThread::CheckEndRequest();
  const std::string lowered = Lowered(management::LocalNameSpace(nameSpace));
  if (lowered != management::kDeviceNameSpace && lowered != management::kFirmwareNameSpace) {
    error = {ManagementStep::kConnect, management::kInvalidNameSpace};
    return nullptr;
  }
  return std::make_unique<LinuxConnection>(folders_, lowered);
}

}  // namespace panelglow::platform::host_linux
