// The management instrumentation of a simulated machine: tables by namespace and class.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "platform/Management.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

class SimManagement : public Management {
 public:
  /// The described tables, and the raw firmware table in the namespace where the genuine service has it.
  explicit SimManagement(const MachineDescription& machine);

  std::unique_ptr<ManagementConnection> Connect(std::string_view nameSpace, ManagementError& error) override;

 private:
  class Connection;
  using Tables = std::map<std::string, std::vector<ManagementRow>>;  // by lowered class name

  std::map<std::string, Tables> nameSpaces_;  // by lowered name
};

}  // namespace panelglow::platform::sim
