// All device services of a simulated machine, and the parts behind them.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "platform/sim/DeviceInventory.h"
#include "platform/sim/DeviceTables.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/SimCameras.h"
#include "platform/sim/SimConnections.h"
#include "platform/sim/SimDeviceTree.h"
#include "platform/sim/SimModules.h"
#include "platform/sim/SimRawDisks.h"
#include "platform/sim/SimRegistry.h"
#include "platform/sim/silicon/Buses.h"

namespace panelglow::platform::sim {

/// `machine` stays with the caller. Throws MachineError.
class SimDevices {
 public:
  SimDevices(const MachineDescription& machine, const DoorContext& context);
  SimDevices(const SimDevices&) = delete;
  SimDevices& operator=(const SimDevices&) = delete;

  /// Those that do something by themselves; the buses own them.
  [[nodiscard]] const std::vector<Device*>& Parts() const { return parts_; }

 private:
  // Makes a part of each setup and gives them to the buses.
  template <class Part, class Setup>
  std::vector<Part*> Attach(const std::vector<Setup>& setups, const DoorContext& context);

  std::vector<Device*> parts_;
  std::vector<DiskDevice*> diskParts_;
  std::function<bool(const std::string&)> isThere_;
  DeviceInventory inventory_;

 public:
  // The services; they stand on what is above.
  SimDeviceTree tree;
  DeviceTables tables;
  SimRegistry registry;
  SimModules modules;
  SimRawDisks disks;
  SimCameras cameras;
  SimConnections connections;
};

}  // namespace panelglow::platform::sim
