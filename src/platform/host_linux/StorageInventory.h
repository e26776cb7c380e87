// The disks of the machine, its floppy drives, and the SCSI ports of its controllers, as the kernel shows them.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/host_linux/PciInventory.h"

namespace panelglow::platform::host_linux {

/// IDE-type controllers are those of ATA disks, SATA ones included; all others of the mass-storage class, NVMe and
/// RAID included, are SCSI-type. Floppy controllers are neither.
enum class ControllerKind { kNone, kIde, kScsi };
ControllerKind ControllerKindOf(const PciFunctionIds& identity);

struct SysfsDisk {
  std::string name = {};  // the kernel's
  std::string instanceId = {};
  std::string cardId = {};  // instance id of the memory card that it is on, which stands for its controller
  std::string model = {};
  std::string serialNumber = {};
  std::uint64_t size_bytes = 0;
  std::optional<std::size_t> owner = {};  // its controller, by place in the list of PCI functions
};

class StorageInventory {
 public:
  StorageInventory(const KernelFolders& folders, const PciInventory& pci);

  /// In the order of their controllers' own counting. Only hardware: no loop devices, no partitions, no drives of
  /// discs.
  [[nodiscard]] const std::vector<SysfsDisk>& Disks() const& { return disks_; }
  void Disks() const&& = delete;

  /// Instance ids.
  [[nodiscard]] const std::vector<std::string>& FloppyDrives() const& { return floppyDrives_; }
  void FloppyDrives() const&& = delete;

 private:
  void AddDisk(const std::string& folder, const std::string& name, const PciInventory& pci);

  std::vector<SysfsDisk> disks_;
  std::vector<std::string> floppyDrives_;
};

/// The drivers of the controllers that have SCSI hosts, by place in the list of PCI functions, as the hosts
/// themselves name them: a paravirtual controller's own driver is not the one that is bound to its PCI function. A
/// controller is one port, however many hosts it has, and ports are counted in this order.
std::map<std::size_t, std::string> ScsiPortDrivers(const KernelFolders& folders, const PciInventory& pci);

/// The driver of a controller by the name under which it has its port; by its PCI driver without a port, and empty
/// without either.
std::string ControllerDriver(const std::map<std::size_t, std::string>& portDrivers, const PciInventory& pci,
                             std::size_t controller);

/// The file to open for a disk: what the path of a disk interface made here stands for, or the path itself when it is
/// a file already. Reads nothing.
std::string DiskFileOf(const KernelFolders& folders, std::string_view path);

}  // namespace panelglow::platform::host_linux
