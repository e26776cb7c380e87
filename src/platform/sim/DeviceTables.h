// The management classes that tell of a machine's devices, made at each query from the description and from what is
// still there.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Management.h"
#include "platform/management/WqlQuery.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

class DeviceTables {
 public:
  /// `machine` stays with the caller. `isThere` tells of a part by its name whether it is still there.
  DeviceTables(const MachineDescription& machine, std::function<bool(const std::string& device)> isThere)
      : machine_(machine), isThere_(std::move(isThere)) {}

  /// All rows of the class; nothing when it is none of these.
  [[nodiscard]] std::optional<std::vector<ManagementRow>> Rows(std::string_view className) const;

  /// What an "ASSOCIATORS OF" query gives: the driver of a device. Nothing when there is no such object.
  [[nodiscard]] std::optional<std::vector<ManagementRow>> Associated(const management::WqlQuery& query) const;

 private:
  [[nodiscard]] std::vector<ManagementRow> Controllers(ControllerDescription::Kind kind) const;
  [[nodiscard]] std::vector<ManagementRow> Disks() const;
  [[nodiscard]] std::vector<ManagementRow> VideoControllers() const;
  [[nodiscard]] std::vector<ManagementRow> Processors() const;

  const MachineDescription& machine_;
  std::function<bool(const std::string&)> isThere_;
};

}  // namespace panelglow::platform::sim
