#include "storage/MSUtils.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <memory>

#include "config/FileLock.h"
#include "config/OrgFileParser.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "hw/PciDeviceList.h"
#include "hw/SetupDI.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kListUnusable = 990294;

constexpr const char* kSataSection = "SATA CONTROLLERS";
constexpr const char* kSasSection = "SAS CONTROLLERS";
constexpr const char* kNvsSection = "NON VOLATILE STORAGE CONTROLLERS";
constexpr const char* kDriveQueryLock = "_PanelglowDriveQuery";
constexpr const char* kTemporaryFile = "\\tmpmsctrl.ini";
constexpr const char* kKeyPrefix = "ENTRY";

// Kinds that the code refers to.
constexpr int kScsi = 2;
constexpr int kStorageLibrary = 4;
constexpr int kStorageLibraryIr = 5;
constexpr int kManagement = 8;
constexpr std::array<std::string_view, 8> kKindWords{"csmi", "scsi", "wind", "stor", "sto2", "cssc", "cswn", "wmi"};

constexpr std::size_t kLongestWord = 512;  // with its NUL
constexpr std::size_t kLongestName = 256;

constexpr std::uint32_t kMassStorage = 1;  // base class of a PCI function

// What the process knows. Records of the list are handed out by pointer and stay where they are.
struct Knowledge {
  std::list<HDD_CTRL_INFO> controllers;
  int nextControllerIndex = 0;
  MSUtils::UsedScsiPorts usedScsiPorts;
  bool firstLoad = true;
};

Knowledge& Known() {
  static Knowledge knowledge;
  return knowledge;
}

[[noreturn]] void FailList(const std::string& file, const std::string& section) {
  auto failure = std::make_unique<CDMException>(kListUnusable);
  failure->addMessage(static_cast<LogOptions>(0), -1, file);
  failure->addMessage(static_cast<LogOptions>(0), -1, section);
  throw failure.release();  // owned by whoever catches it
}

// ---- the lines of a section

// One line's fields are taken from the parser as they are needed; a number that a line lacks is that of the line
// before.
struct LineReader {
  FileParser& parser;
  bool isNvs;
  bool sataFlag;
  CTRL_INFO record = {};

  void ReadIds() {
    parser.NextFieldNumber(record.vendorId, 0);
    parser.NextFieldNumber(record.deviceId, 0);
    if (isNvs) {
      parser.NextFieldString(record.productText);
    } else {
      parser.NextFieldNumber(record.subVendorId, 0);
      parser.NextFieldNumber(record.subDeviceId, 0);
    }
  }
  std::string ReadWord() {
    std::array<char, kLongestWord> room{};
    parser.NextFieldText(room);
    return room.data();
  }
  std::string ReadName() {
    std::array<char, kLongestName> room{' '};
    parser.NextFieldText(room);
    return room.data();
  }
};

// Controllers of two libraries are reached through plain SCSI where the library is missing.
int KindForThisMachine(int kind) {
  if (kind != kStorageLibrary && kind != kStorageLibraryIr) {
    return kind;
  }
  const std::string library = kind == kStorageLibrary ? "storelib.dll" : "storelibIR-2.dll";
  if (platform::TheHost().modules.CanLoad(library)) {
    return kind;
  }
  CDMout::LogMessage(LogOptions::Debug, kFreeText, "WARNING! Could not find " + library + ", switching to scsi!");
  return kScsi;
}

void AddByInventory(LineReader& line, const std::string& word, std::list<CTRL_INFO>& out) {
  CTRL_INFO& record = line.record;
  if (PciDeviceList::Instance().CountDevices(record.vendorId, record.deviceId, record.subVendorId,
                                             record.subDeviceId) == 0) {
    return;
  }
  record.interfaceKind = KindForThisMachine(MSUtils::InterfaceKindOf(word));
  record.sataFlag = line.sataFlag;
  record.name = line.ReadName();
  out.push_back(record);
}

// The name is taken by the first row that matches; a further one finds none left.
void AddByManagement(LineReader& line, std::list<CTRL_INFO>& out) {
  CTRL_INFO& record = line.record;
  record.interfaceKind = kManagement;
  WMIDiscovery& management = WMIDiscovery::Instance();
  const int rows = management.RunQuery(u"SELECT * FROM Win32_SCSIController");
  const std::string vendor = CDMUtil::ToHexString(static_cast<int>(record.vendorId));
  const std::string device = CDMUtil::ToHexString(static_cast<int>(record.deviceId));
  for (int row = 0; row < rows; ++row) {
    std::string id;
    management.GetCurrentValue(u"PNPDeviceID", id, row);
    if (id.find(vendor) != std::string::npos && id.find(device) != std::string::npos &&
        id.find(record.productText) != std::string::npos) {
      record.sataFlag = line.sataFlag;
      record.name = line.ReadName();
      out.push_back(record);
    }
  }
}

// The section's lines under numbered keys in a file of their own, where they can be looked up by key.
void WriteTemporaryFile(OrgFileParser& parser, const std::string& path, const std::string& iniPath,
                        const std::string& section) {
  platform::Files& files = platform::TheHost().files;
  if (Known().firstLoad && files.CanRead(path)) {
    Known().firstLoad = false;
    files.Remove(path);
  }
  if (parser.ReadSection(section) == 0 || parser.ReadValue(section, std::string(kKeyPrefix) + "0")) {
    FailList(iniPath, section);
  }
  parser.SetPrefix(kKeyPrefix);
  parser.SetTargetPath(path);
  parser.EraseSection(section);
  parser.AppendLines(section);
}

// ---- the rows of the management service

std::uint32_t NumberIn(const std::string& digits) {
  return static_cast<std::uint32_t>(std::strtoul(digits.c_str(), nullptr, 0));
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
    if (!isCard && record->interfaceKind != kManagement) {
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

int MSUtils::InterfaceKindOf(const std::string& word) {
  const auto found = std::find_if(kKindWords.begin(), kKindWords.end(),
                                  [&](std::string_view kind) { return CDMUtil::EqualIgnoreCase(kind, word); });
  return found == kKindWords.end() ? 1 : static_cast<int>(found - kKindWords.begin()) + 1;
}

void MSUtils::LoadInfoForControllersInSystem(std::list<CTRL_INFO>& out, const std::string& iniPath,
                                             const std::string& section, bool sataFlag) {
  OrgFileParser source(iniPath);  // its lock is held to the end
  const std::string path = platform::TheHost().files.CurrentDirectory() + kTemporaryFile;
  const FileLock turn(path);  // of another INI file's reader, too
  WriteTemporaryFile(source, path, iniPath, section);
  FileParser parser(path);
  const int count = parser.CountKeys(section);
  if (count == 0) {
    FailList(path, section);
  }
  LineReader line{parser, section == kNvsSection, sataFlag};
  for (int i = 0; i < count; ++i) {
    if (!parser.ReadValue(section, kKeyPrefix + CDMUtil::ToString(i))) {
      continue;
    }
    line.record.productText.clear();
    line.ReadIds();
    const std::string word = line.ReadWord();
    if (line.isNvs && InterfaceKindOf(word) == kManagement) {
      AddByManagement(line, out);
    } else {
      AddByInventory(line, word, out);
    }
  }
}

void MSUtils::CopyControllerListInfo(std::list<CTRL_INFO> records) {
  for (CTRL_INFO& record : records) {
    record.productText.clear();
    static_cast<CTRL_INFO&>(Known().controllers.emplace_back()) = std::move(record);
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
  std::list<HDD_CTRL_INFO>& known = Known().controllers;
  if (!iniPath.empty() && known.empty()) {
    std::list<CTRL_INFO> loaded;
    LoadInfoForControllersInSystem(loaded, iniPath, kSataSection, true);
    LoadInfoForControllersInSystem(loaded, iniPath, kSasSection, false);
    CopyControllerListInfo(loaded);
  }
  const auto found =
      iniPath.empty() ? known.end() : std::find_if(known.begin(), known.end(), [&](const auto& record) {
        return record.vendorId == vendorId && record.deviceId == deviceId && record.subDeviceId == subDeviceId &&
               record.subVendorId == subVendorId;
      });
  return found != known.end() ? &*found : AddUnlistedController(vendorId, deviceId, subDeviceId, subVendorId);
}

HDD_CTRL_INFO* MSUtils::LookupNvsController(std::uint32_t vendorId, std::uint32_t deviceId,
                                            const std::string& /*productText*/, const std::string& iniPath) {
  std::list<HDD_CTRL_INFO>& known = Known().controllers;
  if (!iniPath.empty() && known.empty()) {
    std::list<CTRL_INFO> loaded;
    LoadInfoForControllersInSystem(loaded, iniPath, kNvsSection, true);
    CopyControllerListInfo(loaded);
  }
  const auto found =
      iniPath.empty() ? known.end() : std::find_if(known.begin(), known.end(), [&](const auto& record) {
        return record.vendorId == vendorId && record.deviceId == deviceId;
      });
  return found != known.end() ? &*found : AddUnlistedController(vendorId, deviceId, 0, 0);
}

HDD_CTRL_INFO* MSUtils::AddUnlistedController(std::uint32_t vendorId, std::uint32_t deviceId,
                                              std::uint32_t subDeviceId, std::uint32_t subVendorId) {
  PciDevice device;
  if (!PciDeviceList::Instance().FindDevice(vendorId, deviceId, subVendorId, subDeviceId, 1, device) ||
      (device.classCode >> 16U & 0xFFU) != kMassStorage) {
    return nullptr;
  }
  HDD_CTRL_INFO& record = Known().controllers.emplace_back();
  record.vendorId = vendorId;
  record.deviceId = deviceId;
  record.subVendorId = subVendorId;
  record.subDeviceId = subDeviceId;
  record.interfaceKind = kScsi;
  return &record;
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
    value = value.c_str();
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
