// Which storage controllers the machine has, what the mass-storage INI file calls them, and the path of a drive.
//
// The lists behind it belong to the process and have no lock: one thread fills them, before any worker starts.
#pragma once

#include <initializer_list>
#include <list>
#include <string>
#include <utility>
#include <vector>

#include "hw/WMIDiscovery.h"
#include "storage/CtrlInfo.h"

namespace panelglow {

class MSUtils {
 public:
  /// Appends the controllers of a section of the INI file that are in this machine, in file order. Throws a
  /// CDMException (990294) for a section that is missing, empty or holds the key "ENTRY0", and the integers and
  /// strings of the parsers and the management service. `warnings` takes the log lines that were written.
  static void LoadInfoForControllersInSystem(std::list<CTRL_INFO>& out, const std::string& iniPath,
                                             const std::string& section, bool sataFlag,
                                             std::vector<std::string>* warnings = nullptr);

  /// Appends the records to what the process knows.
  static void CopyControllerListInfo(std::list<CTRL_INFO> records);

  /// Append the controllers that the management service lists and that are known, or called mass storage by the PCI
  /// inventory.
  static void DiscoverInfoListIDEController(const std::string& iniPath, WMIDiscovery* wmi,
                                            std::list<HDD_CTRL_INFO>& out);
  static void DiscoverInfoListSCSIController(const std::string& iniPath, WMIDiscovery* wmi,
                                             std::list<HDD_CTRL_INFO>& out);

  /// The path of the drive with this device instance id; empty when the management service knows none.
  static std::string GetDriveHandleStrUsingDevInstId(const std::string& devInstId);

  // ---- look-ups; the record that they return is the process's own and stays. Null when there is none.
  static HDD_CTRL_INFO* LookupController(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subDeviceId,
                                         std::uint32_t subVendorId, const std::string& iniPath);
  static HDD_CTRL_INFO* LookupNvsController(std::uint32_t vendorId, std::uint32_t deviceId,
                                            const std::string& productText, const std::string& iniPath);

  /// A controller that the INI file does not know, when the PCI inventory calls it mass storage.
  static HDD_CTRL_INFO* AddUnlistedController(std::uint32_t vendorId, std::uint32_t deviceId,
                                              std::uint32_t subDeviceId, std::uint32_t subVendorId);

  using UsedScsiPorts = std::vector<std::pair<std::string, int>>;

  /// The first of the eight SCSI ports of the registry with this driver that has not been given out; -1 for none.
  static int FindScsiPort(const std::string& driverName, UsedScsiPorts& usedScsiPorts);

  /// Forgets what the process knows; for one that runs several machines, as tests do.
  static void Forget();

 private:
  static void LoadKnown(const std::string& iniPath, std::initializer_list<const char*> sections);
};

}  // namespace panelglow
