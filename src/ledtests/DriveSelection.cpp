#include "ledtests/DriveSelection.h"

#include <algorithm>
#include <list>
#include <set>

#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "hw/SetupDI.h"
#include "storage/ControllerNames.h"
#include "storage/MSUtils.h"

namespace panelglow {

namespace {

constexpr std::size_t kLongestName = 127;  // of a name, and of the whole selection, that is compared

std::uint8_t Digit(char c) { return c >= '0' && c <= '9' ? static_cast<std::uint8_t>(c - '0') : std::uint8_t{0}; }

std::list<HDD_CTRL_INFO> FindControllers(const std::string& massStorageIni) {
  std::list<HDD_CTRL_INFO> controllers;
  WMIDiscovery& wmi = WMIDiscovery::Instance();
  MSUtils::DiscoverInfoListIDEController(massStorageIni, &wmi, controllers);
  MSUtils::DiscoverInfoListSCSIController(massStorageIni, &wmi, controllers);
  return controllers;
}

}  // namespace

std::vector<std::string> getCntrlListForHDD(const std::string& selection, const std::string& massStorageIni,
                                            bool anyIsOne) {
  std::vector<std::string> wanted;
  CDMUtil::Split(selection.substr(0, kLongestName), wanted, ",");
  ControllerNames names(massStorageIni);
  std::vector<std::string> ids;
  std::string named;  // the controllers with a disk, for people
  for (const HDD_CTRL_INFO& controller : FindControllers(massStorageIni)) {
    if (FindDiskOf(controller.pnpDeviceId).empty()) {
      continue;  // without a disk nothing can be lit
    }
    if (selection == "all") {
      ids.push_back(controller.pnpDeviceId);
      continue;
    }
    if (anyIsOne && selection == "any") {
      ids.push_back(controller.pnpDeviceId);
      break;
    }
    const std::string name = names.Find(controller.Ids()).substr(0, kLongestName);
    ids.insert(ids.end(), static_cast<std::size_t>(std::count(wanted.begin(), wanted.end(), name)),
               controller.pnpDeviceId);
    named += (named.empty() ? "" : ", ") + (name.empty() ? "one without a name" : "\"" + name + "\"");
  }
  if (ids.empty()) {
    Notices::Tell(named.empty() ? "No drive LED is tested: no storage controller has a disk."
                                : "No drive LED is tested: \"" + selection +
                                      "\" names no controller with a disk. Those with one, by their names in " +
                                      massStorageIni + ": " + named +
                                      "; a name counts as it is spelled there, and XML files can only name those "
                                      "without capitals.");
  }
  return ids;
}

std::string FindControllerDetails(std::uint32_t vendorId, std::uint32_t deviceId, std::uint32_t subDeviceId,
                                  std::uint32_t subVendorId, const std::string& massStorageIni) {
  return ControllerNames(massStorageIni).Find({vendorId, deviceId, subVendorId, subDeviceId});
}

std::string FindDiskOf(const std::string& controllerId) {
  SetupDI controller(controllerId.c_str());
  SetupDI child;
  std::set<platform::DeviceNode> seen;  // a tree that is changing, or broken, may lead in a circle
  while (controller.NextChild(child) && seen.insert(child.GetDevNode()).second) {
    std::string id = child.GetDeviceInstanceId();
    if (!id.empty() && !child.GetInterfaceDevicePath(id, platform::kDiskInterface).empty()) {
      return id;
    }
  }
  return {};
}

std::string FindDrivePath(std::string_view type) {
  SetupDI disks;
  if (!disks.OpenDeviceList("", platform::kPresentDevices | platform::kDeviceInterfaces, platform::kDiskInterface)) {
    return {};
  }
  const std::string wanted = "\\" + std::string(type);
  while (disks.NextInterface()) {
    std::string path = disks.GetInterfaceDevicePath();
    if (path.find(wanted) != std::string::npos) {
      return path;
    }
  }
  return {};
}

std::uint8_t ParseBufferForAdapter(std::string_view address) {
  return address.empty() ? std::uint8_t{0} : Digit(address[0]);
}

std::uint8_t ParseBufferForTarget(std::string_view address) {
  if (address.size() <= 2) {
    return 0;
  }
  const bool isLong = address.size() > 3 && address[3] >= '0' && address[3] <= '9';
  return isLong ? static_cast<std::uint8_t>(Digit(address[2]) * 10 + Digit(address[3])) : Digit(address[2]);
}

std::uint8_t ParseBufferForLun(std::string_view address) {
  return address.size() > 4 ? Digit(address[4]) : std::uint8_t{0};
}

}  // namespace panelglow
