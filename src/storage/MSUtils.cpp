#include "storage/MSUtils.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <limits>
#include <map>
#include <memory>
#include <set>
#include <string_view>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "hw/PciDeviceList.h"
#include "hw/SetupDI.h"
#include "platform/Host.h"
#include "storage/ControllerSection.h"

namespace panelglow {

namespace {

constexpr const char* kDriveQueryLock = "_PanelglowDriveQuery";
constexpr std::uint32_t kMassStorage = 1;  // base class of a PCI function

// What the process knows. Records of the list are handed out by pointer and stay where they are.
struct Knowledge {
  std::list<HDD_CTRL_INFO> controllers;
  std::map<ControllerIds, HDD_CTRL_INFO*> byIds;  // the first of equal ones, as in the next
  std::map<std::pair<std::uint32_t, std::uint32_t>, HDD_CTRL_INFO*> byVendorAndDevice;
  int nextControllerIndex = 0;
  MSUtils::UsedScsiPorts usedScsiPorts;
  bool firstLoad = true;
  std::set<std::pair<std::string, std::string>> barren;  // files and sections that hold nothing of this machine

  HDD_CTRL_INFO* Add(CTRL_INFO record) {
    HDD_CTRL_INFO& added = controllers.emplace_back();
    static_cast<CTRL_INFO&>(added) = std::move(record);
    byIds.emplace(added.Ids(), &added);
    byVendorAndDevice.emplace(std::pair(added.vendorId, added.deviceId), &added);
    return &added;
  }
};

Knowledge& Known() {
  static Knowledge knowledge;
  return knowledge;
}

template <class Key>
HDD_CTRL_INFO* Find(const std::map<Key, HDD_CTRL_INFO*>& records, const Key& key) {
  const auto found = records.find(key);
  return found == records.end() ? nullptr : found->second;
}

// ---- the rows of the management service

// Larger ones are the largest, as in a system whose `long` has 32 bits.
std::uint32_t NumberIn(const std::string& digits) {
  return static_cast<std::uint32_t>(
      std::min<unsigned long>(std::strtoul(digits.c_str(), nullptr, 0), std::numeric_limits<std::uint32_t>::max()));
}

std::string Piece(const std::string& text, std::size_t position, std::size_t length) {
  return position < text.size() ? text.substr(position, length) : std::string();
}

bool BeginsWith(const std::string& text, std::string_view begin) {
  return CDMUtil::EqualIgnoreCase(std::string_view(text).substr(0, begin.size()), begin);
}

std::string WithDoubledBackslashes(const std::string& text) {
  std::string doubled;
  for (const char c : text) {
    doubled += c == '\\' ? "\\\\" : std::string(1, c);
  }
  return doubled;
}

std::uint32_t UiNumberOf(const std::string& instanceId) {
  const SetupDI device(instanceId.c_str());
  std::array<std::uint8_t, 4> bytes{};
  std::uint32_t type = 0;
  if (device.ReadNodeProperty(platform::kNodeUiNumberProperty, bytes, type) != bytes.size()) {
    return 0;
  }
  std::uint32_t number = 0;
  for (std::size_t i = bytes.size(); i-- > 0;) {
    number = number << 8U | bytes[i];
  }
  return number;
}

// SD\VID_vv&OID_oooo&PID_pppppp
HDD_CTRL_INFO* LookUpCard(const std::string& id, const std::string& iniPath) {
  constexpr std::size_t kVendor = 7;
  const std::size_t first = std::min(id.find('&'), id.size());
  const std::string vendor = first > kVendor ? Piece(id, kVendor, first - kVendor) : std::string();
  return MSUtils::LookupNvsController(NumberIn("0x" + vendor), NumberIn("0x" + Piece(id, first + 5, 4)),
                                      Piece(id, first + 14, 6), iniPath);
}

// PCI\VEN_vvvv&DEV_dddd&SUBSYS_ssssuuuu&...
HDD_CTRL_INFO* LookUpFunction(const std::string& id, const std::string& iniPath) {
  const auto number = [&](std::size_t position) { return NumberIn("0x" + Piece(id, position, 4)); };
  return MSUtils::LookupController(number(8), number(17), number(29), number(33), iniPath);
}

// The driver of an IDE-type controller is what the management service associates with it.
std::int32_t ScsiPortOfAssociated(const std::string& id, WMIDiscovery& wmi) {
  const std::string query = "ASSOCIATORS OF {Win32_PnPEntity.DeviceID=\"" + WithDoubledBackslashes(id) +
                            "\"} WHERE ResultClass=Win32_SystemDriver";
  if (wmi.RunQuery(CDMUtil::ToWString(query)) <= 0) {
    return -1;
  }
  std::string driver;
  wmi.GetCurrentValue(u"Name", driver, 0);
  return MSUtils::FindScsiPort(driver, Known().usedScsiPorts);
}

void DiscoverControllerRows(const wstring& tableName, int rows, const std::string& iniPath, WMIDiscovery& wmi,
                            std::list<HDD_CTRL_INFO>& out, bool isIde) {
  for (int row = 0; row < rows; ++row) {
    std::string id;
    wmi.GetValue(tableName, u"PNPDeviceID", id, row);
    const bool isCard = BeginsWith(id, "SD\\");
    if (!isCard && !BeginsWith(id, "PCI\\")) {
      continue;
    }
    HDD_CTRL_INFO* const record = isCard ? LookUpCard(id, iniPath) : LookUpFunction(id, iniPath);
    if (record == nullptr) {
      continue;
    }
    wmi.GetValue(tableName, u"Description", record->description, row);
    record->pnpDeviceId = id;
    record->uiNumber = UiNumberOf(id);
    record->controllerIndex = Known().nextControllerIndex++;
    if (!isCard && record->interfaceKind != kManagementKind) {
      if (isIde) {
        record->scsiPort = ScsiPortOfAssociated(id, wmi);
      } else {
        std::string driver;
        wmi.GetValue(tableName, u"DriverName", driver, row);
        record->scsiPort = MSUtils::FindScsiPort(driver, Known().usedScsiPorts);
      }
    }
    out.push_back(*record);
  }
}

void Discover(const wstring& tableName, const wstring& className, const std::string& iniPath, WMIDiscovery& wmi,
              std::list<HDD_CTRL_INFO>& out, bool isIde) {
  wmi.RunNamedQuery(tableName, u"SELECT * FROM " + className);
  const int rows = wmi.RowCount(tableName);
  if (rows > 0) {
    DiscoverControllerRows(tableName, rows, iniPath, wmi, out, isIde);
  }
}

}  // namespace

// Fills what the process knows from the file, unless it has been found to hold nothing of this machine: then a
// further row of the management service is not worth another reading.
void MSUtils::LoadKnown(const std::string& iniPath, std::initializer_list<const char*> sections) {
  if (!Known().controllers.empty() || Known().barren.count({iniPath, *sections.begin()}) != 0) {
    return;
  }
  std::list<CTRL_INFO> loaded;
  for (const char* section : sections) {
    LoadInfoForControllersInSystem(loaded, iniPath, section, std::string_view(section) != kSasSection);
  }
  if (loaded.empty()) {
    Known().barren.insert({iniPath, *sections.begin()});
  }
  CopyControllerListInfo(std::move(loaded));
}

void MSUtils::LoadInfoForControllersInSystem(std::list<CTRL_INFO>& out, const std::string& iniPath,
                                             const std::string& section, bool sataFlag,
                                             std::vector<std::string>* warnings) {
  ControllerSection lines(iniPath, section, sataFlag);
  lines.Load(out, Known().firstLoad);
  if (warnings != nullptr) {
    warnings->insert(warnings->end(), lines.Warnings().begin(), lines.Warnings().end());
  }
}

void MSUtils::CopyControllerListInfo(std::list<CTRL_INFO> records) {
  for (CTRL_INFO& record : records) {
    record.productText.clear();
    Known().Add(std::move(record));
  }
}

void MSUtils::DiscoverInfoListIDEController(const std::string& iniPath, WMIDiscovery* wmi,
                                            std::list<HDD_CTRL_INFO>& out) {
  Discover(u"IDEControllers", u"Win32_IDEController", iniPath, *wmi, out, true);
}

void MSUtils::DiscoverInfoListSCSIController(const std::string& iniPath, WMIDiscovery* wmi,
                                             std::list<HDD_CTRL_INFO>& out) {
  Discover(u"Controllers", u"Win32_SCSIController", iniPath, *wmi, out, false);
}

// ---- look-ups

HDD_CTRL_INFO* MSUtils::LookupController(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subDeviceId,
                                         std::uint32_t subVendorId, const std::string& iniPath) {
  if (!iniPath.empty()) {
    LoadKnown(iniPath, {kSataSection, kSasSection});
    if (HDD_CTRL_INFO* known = Find(Known().byIds, ControllerIds{vendorId, deviceId, subVendorId, subDeviceId})) {
      return known;
    }
  }
  return AddUnlistedController(vendorId, deviceId, subDeviceId, subVendorId);
}

HDD_CTRL_INFO* MSUtils::LookupNvsController(std::uint32_t vendorId, std::uint32_t deviceId,
                                            const std::string& /*productText*/, const std::string& iniPath) {
  if (!iniPath.empty()) {
    LoadKnown(iniPath, {kNvsSection});
    if (HDD_CTRL_INFO* known = Find(Known().byVendorAndDevice, std::pair(vendorId, deviceId))) {
      return known;
    }
  }
  return AddUnlistedController(vendorId, deviceId, 0, 0);
}

HDD_CTRL_INFO* MSUtils::AddUnlistedController(std::uint32_t vendorId, std::uint32_t deviceId,
                                              std::uint32_t subDeviceId, std::uint32_t subVendorId) {
  PciDevice device;
  if (!PciDeviceList::Instance().FindDevice(vendorId, deviceId, subVendorId, subDeviceId, 1, device) ||
      (device.classCode >> 16U & 0xFFU) != kMassStorage) {
    return nullptr;
  }
  CTRL_INFO record;
  record.vendorId = vendorId;
  record.deviceId = deviceId;
  record.subVendorId = subVendorId;
  record.subDeviceId = subDeviceId;
  record.interfaceKind = kScsiKind;
  return Known().Add(std::move(record));
}

int MSUtils::FindScsiPort(const std::string& driverName, UsedScsiPorts& usedScsiPorts) {
  constexpr int kPorts = 8;
  constexpr std::size_t kFirstBuffer = 32;
  constexpr std::size_t kLargestValue = 65536;
  for (int port = 0; port < kPorts; ++port) {
    const std::unique_ptr<platform::RegistryKey> key = platform::TheHost().registry.OpenMachineKey(
        "HARDWARE\\DEVICEMAP\\Scsi\\Scsi Port " + CDMUtil::ToString(port));
    if (!key) {
      continue;
    }
    std::string value(kFirstBuffer, '\0');
    std::size_t size = 0;
    if (key->Read("Driver", value, size) == platform::kMoreData && size <= kLargestValue) {
      value.assign(size, '\0');
      key->Read("Driver", value, size);
    }
    value.resize(std::min(value.find('\0'), value.size()));  // the registry ends it with NUL
    if (!BeginsWith(value, driverName)) {
      continue;
    }
    const std::pair<std::string, int> pair(driverName, port);
    if (std::find(usedScsiPorts.begin(), usedScsiPorts.end(), pair) == usedScsiPorts.end()) {
      usedScsiPorts.push_back(pair);
      return port;
    }
  }
  return -1;
}

// ---- drives

std::string MSUtils::GetDriveHandleStrUsingDevInstId(const std::string& devInstId) {
  // Two workers may ask at once, one of them late; the management service is not made for that.
  const platform::NamedMutexLock turn(platform::TheHost().mutexes, kDriveQueryLock);
  const wstring table = u"HDDs";
  WMIDiscovery& wmi = WMIDiscovery::Instance();
  wmi.RunNamedQuery(table, CDMUtil::ToWString("SELECT * FROM Win32_DiskDrive where PNPDeviceID='" +
                                              WithDoubledBackslashes(devInstId) + "'"));
  const int rows = wmi.RowCount(table);
  std::string path;
  if (rows > 0) {
    wmi.GetValue(table, u"DeviceID", path, rows - 1);
  }
  return path;
}

void MSUtils::Forget() { Known() = {}; }

}  // namespace panelglow
