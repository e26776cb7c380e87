#include "platform/host_linux/StorageInventory.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdio>
#include <limits>
#include <utility>

namespace panelglow::platform::host_linux {

namespace {

constexpr std::uint64_t kSector_bytes = 512;  // in which the kernel counts sizes, whatever the disk's own is

// Lengths of an identification's fields.
constexpr std::size_t kAtaModel = 40;
constexpr std::size_t kAtaRevision = 8;
constexpr std::size_t kScsiVendor = 8;
constexpr std::size_t kScsiProduct = 16;
constexpr std::size_t kScsiRevision = 4;
constexpr std::size_t kCardProduct = 6;

// A field of an identification as an instance id holds it.
std::string IdField(std::string text, std::size_t length) {
  text.resize(std::min(text.size(), length));
  std::replace_if(
      text.begin(), text.end(),
      [](char c) { return std::isalnum(static_cast<unsigned char>(c)) == 0 && c != '-' && c != '.'; }, '_');
  return text;
}

std::string PaddedField(const std::string& text, std::size_t length) {
  std::string field = IdField(text, length);
  field.resize(length, '_');
  return field;
}

struct Identification {
  std::string vendor;
  std::string model;
  std::string revision;
  std::string serialNumber;
};

// `device`: the folder of what the disk is a disk of.
Identification ReadIdentification(const std::string& disk, const std::string& device) {
  const auto text = [](const std::string& path) { return ReadKernelText(path); };
  Identification found{text(device + "/vendor"), text(device + "/model"), text(device + "/rev"),
                       text(device + "/serial")};
  if (found.revision.empty()) {
    found.revision = text(device + "/firmware_rev");
  }
  if (found.serialNumber.empty()) {
    found.serialNumber = text(disk + "/serial");
  }
  if (found.vendor.compare(0, 2, "0x") == 0) {  // a paravirtual disk has the numbers of its device
    found.vendor = "VirtIO";
  }
  if (found.vendor.empty() && !found.model.empty() && device.find("nvme") != std::string::npos) {
    found.vendor = "NVMe";
  }
  if (found.model.empty()) {
    found.model = text(device + "/name");  // of a memory card
  }
  if (found.model.empty()) {
    found.model = "Disk";
  }
  return found;
}

// Letters and digits, and '!' where the device file is in a folder.
bool IsDiskName(std::string_view name) {
  return !name.empty() && std::all_of(name.begin(), name.end(), [](char c) {
    return (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '!';
  });
}

bool BeginsWith(std::string_view text, std::string_view begin) { return text.substr(0, begin.size()) == begin; }

bool IsUsb(const std::string& realPath) {
  const std::vector<std::string> names = PathNames(realPath);
  return std::any_of(names.begin(), names.end(), [](const std::string& name) {
    return BeginsWith(name, "usb") && name.size() > 3 && std::isdigit(static_cast<unsigned char>(name[3])) != 0;
  });
}

std::string DeviceIdOfDisk(const Identification& found, bool isUsb, bool isCard, ControllerKind kind) {
  if (isUsb) {
    return "USBSTOR\\Disk&Ven_" + IdField(found.vendor, kScsiVendor) + "&Prod_" + IdField(found.model, kScsiProduct) +
           "&Rev_" + IdField(found.revision, kScsiRevision);
  }
  if (isCard) {
    return "SD\\Disk&Prod_" + IdField(found.model, kScsiProduct);
  }
  if (kind == ControllerKind::kIde) {
    return "IDE\\Disk" + PaddedField(found.model, kAtaModel) + PaddedField(found.revision, kAtaRevision);
  }
  return "SCSI\\Disk&Ven_" + IdField(found.vendor, kScsiVendor) + "&Prod_" + IdField(found.model, kScsiProduct);
}

// A memory card, soldered ones included, by its identification register. Empty when the kernel does not show it.
std::string DeviceIdOfCard(const std::string& device) {
  const auto manufacturer = ReadKernelNumber(device + "/manfid", 0xFF);
  const auto application = ReadKernelNumber(device + "/oemid", 0xFFFF);
  const std::string product = ReadKernelText(device + "/name");
  if (!manufacturer || !application || product.empty()) {
    return {};
  }
  std::array<char, 32> numbers{};
  std::snprintf(numbers.data(), numbers.size(), "SD\\VID_%02X&OID_%04X&PID_", static_cast<unsigned>(*manufacturer),
                static_cast<unsigned>(*application));
  return numbers.data() + IdField(product, kCardProduct);
}

// What tells the disks of one kind apart; ends with the name, by which the file is found again.
std::string InstanceOf(const std::string& name, const PciInventory& pci, std::optional<std::size_t> owner) {
  std::array<char, 32> place{};
  std::snprintf(place.data(), place.size(), "\\4&%04X&0&",
                owner ? static_cast<unsigned>(pci.Functions()[*owner].location) : 0xFFFFU);
  return place.data() + name;
}

// The drives that disks look like: optical ones, tapes and more have type numbers of their own.
bool IsDiskType(const std::string& device) {
  constexpr std::uint64_t kDirectAccess = 0;
  constexpr std::uint64_t kReducedBlock = 14;
  const std::string word = ReadKernelText(device + "/type");
  if (word.empty() || word == "SD" || word == "MMC") {
    return true;  // of no bus with types, or a memory card
  }
  const auto type = ReadKernelNumber(device + "/type", std::numeric_limits<std::uint64_t>::max());
  return type && (*type == kDirectAccess || *type == kReducedBlock);  // and no flash memory of the firmware ("nor")
}

// A disk that several controllers reach hangs on none of them in the kernel's tree; it is given to the first.
std::optional<std::size_t> OwnerOfShared(const std::string& device, const PciInventory& pci) {
  for (const std::string& name : KernelNames(device)) {
    const std::string path = BeginsWith(name, "nvme") ? RealPath(device + "/" + name) : std::string();
    if (const auto owner = pci.OwnerOf(path)) {
      return owner;
    }
  }
  return std::nullopt;
}

}  // namespace

ControllerKind ControllerKindOf(const PciFunctionIds& identity) {
  constexpr std::uint32_t kMassStorage = 0x01;
  if (identity.classCode >> 16U != kMassStorage) {
    return ControllerKind::kNone;
  }
  switch (identity.classCode >> 8U & 0xFFU) {
    case 0x02:  // floppy
      return ControllerKind::kNone;
    case 0x01:  // IDE
    case 0x05:  // ATA with DMA
    case 0x06:  // SATA
      return ControllerKind::kIde;
    default:
      return ControllerKind::kScsi;
  }
}

StorageInventory::StorageInventory(const KernelFolders& folders, const PciInventory& pci) {
  const std::string block = folders.sys + "/block/";
  std::vector<std::pair<std::string, std::string>> found;  // path and name
  for (const std::string& name : KernelNames(block)) {
    // What is no piece of hardware has no device behind it.
    if (IsDiskName(name) && !RealPath(block + name + "/device").empty()) {
      found.emplace_back(RealPath(block + name), name);
    }
  }
  std::sort(found.begin(), found.end(),
            [](const auto& one, const auto& other) { return IsAheadOf(one.first, other.first); });
  for (const auto& [path, name] : found) {
    AddDisk(path, name, pci);
  }
}

void StorageInventory::AddDisk(const std::string& folder, const std::string& name, const PciInventory& pci) {
  const bool isCard = BeginsWith(name, "mmcblk");
  if (BeginsWith(name, "fd")) {
    floppyDrives_.push_back("FDC\\GENERIC_FLOPPY_DRIVE" + InstanceOf(name, pci, std::nullopt));
    return;
  }
  const std::string device = RealPath(folder + "/device");
  const bool isPartOfCard =
      isCard && name.find_first_not_of("0123456789", 6) != std::string::npos;  // as its boot area
  if (isPartOfCard || ReadKernelNumber(folder + "/hidden", 1) == 1 || !IsDiskType(device)) {
    return;
  }
  SysfsDisk disk{.name = name, .owner = pci.OwnerOf(folder)};
  if (!disk.owner && device.find("/nvme-subsystem/") != std::string::npos) {
    disk.owner = OwnerOfShared(device, pci);
  }
  const Identification identification = ReadIdentification(folder, device);
  const ControllerKind kind =
      disk.owner ? ControllerKindOf(pci.Functions()[*disk.owner].identity) : ControllerKind::kNone;
  disk.instanceId = DeviceIdOfDisk(identification, IsUsb(folder), isCard, kind) + InstanceOf(name, pci, disk.owner);
  const std::string card = isCard ? DeviceIdOfCard(device) : std::string();
  disk.cardId = card.empty() ? card : card + InstanceOf(name, pci, disk.owner);
  // An ATA disk's vendor is only the name of its command set.
  disk.model = identification.vendor.empty() || identification.vendor == "ATA" || identification.vendor == "NVMe"
                   ? identification.model
                   : identification.vendor + " " + identification.model;
  disk.serialNumber = identification.serialNumber;
  constexpr std::uint64_t kMostSectors = std::numeric_limits<std::uint64_t>::max() / kSector_bytes;
  disk.size_bytes = ReadKernelNumber(folder + "/size", kMostSectors).value_or(0) * kSector_bytes;
  disks_.push_back(std::move(disk));
}

std::map<std::size_t, std::string> ScsiPortDrivers(const KernelFolders& folders, const PciInventory& pci) {
  std::map<std::size_t, std::string> drivers;
  const std::string hosts = folders.sys + "/class/scsi_host/";
  for (const std::string& name : KernelNames(hosts)) {
    const auto owner = pci.OwnerOf(RealPath(hosts + name));
    if (!owner || ControllerKindOf(pci.Functions()[*owner].identity) == ControllerKind::kNone) {
      continue;  // of a USB disk, or of the network
    }
    std::string driver = ReadKernelText(hosts + name + "/proc_name");
    if (!driver.empty() && driver != "<NULL>" && driver != "(null)") {
      drivers.emplace(*owner, std::move(driver));
    }
  }
  return drivers;
}

std::string ControllerDriver(const std::map<std::size_t, std::string>& portDrivers, const PciInventory& pci,
                             std::size_t controller) {
  const auto port = portDrivers.find(controller);
  return port == portDrivers.end() ? pci.Functions()[controller].driver : port->second;
}

std::string DiskFileOf(const KernelFolders& folders, std::string_view path) {
  constexpr std::string_view kInterface = "\\\\?\\";
  if (!BeginsWith(path, kInterface)) {
    return std::string(path);
  }
  const std::string_view instance = path.substr(0, path.rfind("#{"));
  std::string name(instance.substr(instance.rfind('&') + 1));
  if (instance.size() == path.size() || !IsDiskName(name)) {
    return std::string(path);
  }
  std::replace(name.begin(), name.end(), '!', '/');
  return folders.dev + "/" + name;
}

}  // namespace panelglow::platform::host_linux
