// The management instrumentation of the real machine: rows made of what the kernel shows.
#pragma once

#include <utility>

#include "platform/Management.h"
#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

/// The namespaces are ROOT\CIMV2, with the controllers of disks, the disks, the processors, the display adapters and
/// the drivers of controllers, and ROOT\WMI, with the firmware's structure table. Rows are made at each query. There
/// is no way here to call the firmware: the class that takes calls does not exist.
class LinuxManagement : public Management {
 public:
  /// Touches nothing.
  explicit LinuxManagement(KernelFolders folders = {}) : folders_(std::move(folders)) {}

  std::unique_ptr<ManagementConnection> Connect(std::string_view nameSpace, ManagementError& error) override;

 private:
  const KernelFolders folders_;
};

}  // namespace panelglow::platform::host_linux
