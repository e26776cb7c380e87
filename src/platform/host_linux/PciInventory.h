// The PCI functions of the machine, by what the kernel knows of each: no configuration space is read and no right is
// needed.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/DeviceIds.h"
#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

struct SysfsPciFunction {
  std::uint16_t location = 0;  // bus in the high byte, device in bits 7 to 3, function below
  PciFunctionIds identity = {};
  std::string driver = {};                       // the kernel's, empty when none is bound
  std::optional<std::uint32_t> slotNumber = {};  // of the physical slot
  std::optional<std::size_t> parent = {};        // the bridge that it is behind, by place in the list
};

/// The kernel's name for the function at a place.
std::string KernelName(std::uint16_t location);

class PciInventory {
 public:
  /// Those of domain 0, in the order of their locations. A function that the kernel tells no ids of is left out.
  explicit PciInventory(const KernelFolders& folders);

  [[nodiscard]] const std::vector<SysfsPciFunction>& Functions() const& { return functions_; }
  void Functions() const&& = delete;

  /// The function that a device hangs on, by its path without links; nothing when it hangs on none. A device of
  /// another domain counts to the function that bridges to that domain.
  [[nodiscard]] std::optional<std::size_t> OwnerOf(const std::string& realPath) const;

 private:
  std::vector<SysfsPciFunction> functions_;
  std::map<std::string, std::size_t> places_;  // by the kernel's name
};

}  // namespace panelglow::platform::host_linux
