// What tells a machine's storage controllers: instance ids and hardware ids of any bytes, and the list of
// controllers. Five lines (the ids of an IDE-type and a SCSI-type controller, hardware ids of a PCI function with '|'
// for the NUL between them, its location, the driver's name), and the mass-storage file behind them.
#include <algorithm>
#include <list>
#include <memory>

#include "FuzzTarget.h"
#include "harness/base/CDMException.h"
#include "harness/base/Notices.h"
#include "hw/PciDeviceList.h"
#include "hw/SetupDI.h"
#include "hw/WMIDiscovery.h"
#include "storage/MSUtils.h"

namespace panelglow::fuzz {
namespace {

namespace sim = platform::sim;

void ForgetMachine() {
  MSUtils::Forget();
  PciDeviceList::Forget();
  WMIDiscovery::Forget();
  Notices::Forget();
}

sim::ControllerDescription ControllerOf(std::string id, sim::ControllerDescription::Kind kind,
                                        const std::string& driver, std::uint8_t port) {
  sim::ControllerDescription controller;
  controller.name = std::to_string(port);
  controller.instanceId = std::move(id);
  controller.kind = kind;
  controller.driver = driver;
  controller.scsiPorts = {port};
  return controller;
}

void CheckInventory() {
  try {
    for (const PciDevice& device : PciDeviceList::Instance().Devices()) {
      Check(device.classCode <= 0xFFFFFF, "a class code has 24 bits");
      PciDevice found;
      const int count = PciDeviceList::Instance().CountDevices(device.vendorId, device.deviceId, device.subVendorId,
                                                               device.subDeviceId);
      Check(count > 0 && PciDeviceList::Instance().FindDevice(device.vendorId, device.deviceId, device.subVendorId,
                                                              device.subDeviceId, count, found),
            "every function is found by its own ids");
      std::string description;
      SetupDI().FindPciDevice(device.vendorId, device.deviceId, device.subVendorId, device.subDeviceId, description);
    }
  } catch (int code) {
    Check(code == PciDeviceList::kNoInventory, "an inventory that cannot be read is told by its number");
  }
}

bool IsText(const std::string& id) {
  return std::all_of(id.begin(), id.end(), [](char c) { return c >= ' ' && c <= '~'; });
}

void Discover(const std::string& first, const std::string& second) {
  std::list<HDD_CTRL_INFO> found;
  try {
    WMIDiscovery& wmi = WMIDiscovery::Instance();
    MSUtils::DiscoverInfoListIDEController("msctrl.ini", &wmi, found);
    MSUtils::DiscoverInfoListSCSIController("msctrl.ini", &wmi, found);
  } catch (const CDMException* failure) {
    delete failure;
  } catch (int) {
  }
  for (const HDD_CTRL_INFO& controller : found) {
    // What is no text comes back from the management service as another one.
    const bool isText = IsText(first) && IsText(second);
    Check(!isText || controller.pnpDeviceId == first || controller.pnpDeviceId == second,
          "a controller goes by its own id");
    Check(controller.scsiPort >= -1 && controller.scsiPort <= 7, "there are eight ports");
    MSUtils::GetDriveHandleStrUsingDevInstId(controller.pnpDeviceId);
  }
}

void Run(std::string_view bytes) {
  const std::string first = Take(bytes, '\n');
  const std::string second = Take(bytes, '\n');
  std::string hardwareIds = Take(bytes, '\n');
  const std::string location = Take(bytes, '\n');
  const std::string driver = Take(bytes, '\n');
  sim::MachineDescription description;
  description.controllers = {ControllerOf(first, sim::ControllerDescription::Kind::kIde, driver, 0),
                             ControllerOf(second, sim::ControllerDescription::Kind::kScsi, driver, 1)};
  description.enumerated.push_back({"PCI\\function", {}, location, ""});
  while (!hardwareIds.empty()) {
    std::string_view rest = hardwareIds;
    description.enumerated.back().hardwareIds.push_back(Take(rest, '|'));
    hardwareIds = rest;
  }
  sim::SimulationOptions options;
  options.timeLimit_us = 0;
  std::unique_ptr<sim::Simulation> machine;
  try {
    machine = std::make_unique<sim::Simulation>(std::move(description), options);
  } catch (const sim::MachineError&) {
    return;  // two devices of one id
  }
  ForgetMachine();
  machine->DiskFiles().Put("msctrl.ini", std::string(bytes));
  CheckInventory();
  Discover(first, second);
  ForgetMachine();
}

const Registered kTarget("device_ids", Run);

}  // namespace
}  // namespace panelglow::fuzz
