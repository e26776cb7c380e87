// The registry of a simulated machine, as far as its SCSI ports go.
#pragma once

#include <map>
#include <memory>
#include <string>

#include "platform/Registry.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

/// A key "HARDWARE\DEVICEMAP\Scsi\Scsi Port N" for each port that a controller's driver occupies, with the driver's
/// name as "Driver".
class SimRegistry : public Registry {
 public:
  /// Throws MachineError when two controllers have the same port.
  SimRegistry(const MachineDescription& machine, Scheduler& scheduler);

  std::unique_ptr<RegistryKey> OpenMachineKey(std::string_view path) override;

 private:
  class Key;
  using Values = std::map<std::string, std::string>;  // by lowered name

  Scheduler& scheduler_;
  std::map<std::string, Values> keys_;  // by lowered path
};

}  // namespace panelglow::platform::sim
