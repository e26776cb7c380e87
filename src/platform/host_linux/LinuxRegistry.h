// The registry of the real machine, as far as its SCSI ports go.
#pragma once

#include <utility>

#include "platform/Registry.h"
#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

/// A key "HARDWARE\DEVICEMAP\Scsi\Scsi Port N" for each controller with SCSI hosts, with its driver's name as
/// "Driver". Ports are counted in the order in which the management service lists controllers of one driver, so that
/// the first of these has its first port.
class LinuxRegistry : public Registry {
 public:
  /// Touches nothing.
  explicit LinuxRegistry(KernelFolders folders = {}) : folders_(std::move(folders)) {}

  std::unique_ptr<RegistryKey> OpenMachineKey(std::string_view path) override;

 private:
  const KernelFolders folders_;
};

}  // namespace panelglow::platform::host_linux
