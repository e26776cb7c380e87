// The management instrumentation of a simulated machine: tables by namespace and class.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "platform/Management.h"
#include "platform/sim/DeviceTables.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/FirmwareCall.h"

namespace panelglow::platform::sim {

class SimManagement : public Management {
 public:
  /// The described tables, the raw firmware table in the namespace where the genuine service has it, and those of the
  /// devices, unless the description has one of that name. `devices` stays with the caller. `firmware` answers calls,
  /// null where there is nobody to; `moved` is called after a call.
  SimManagement(const MachineDescription& machine, const DeviceTables& devices, Scheduler& scheduler,
                FirmwareCall* firmware, std::function<void()> moved);

  std::unique_ptr<ManagementConnection> Connect(std::string_view nameSpace, ManagementError& error) override;

 private:
  class Connection;
  using Tables = std::map<std::string, std::vector<ManagementRow>>;  // by lowered class name

  const DeviceTables& devices_;
  Scheduler& scheduler_;
  FirmwareCall* firmware_;
  std::function<void()> moved_;
  std::map<std::string, Tables> nameSpaces_;  // by lowered name
};

}  // namespace panelglow::platform::sim
