#include "platform/host_linux/ClassNames.h"

#include <algorithm>
#include <array>
#include <string_view>

namespace panelglow::platform::host_linux {

namespace {

struct ClassName {
  std::uint32_t code;  // leading digits of the class code
  unsigned shift;      // bits of it behind those
  std::string_view name;
};

// The narrower first.
constexpr std::array kNames{
    ClassName{0x010601, 0, "SATA AHCI Controller"},
    ClassName{0x010802, 0, "NVM Express Controller"},
    ClassName{0x0C0310, 0, "USB Open Host Controller"},
    ClassName{0x0C0300, 0, "USB Universal Host Controller"},
    ClassName{0x0C0320, 0, "USB Enhanced Host Controller"},
    ClassName{0x0C0330, 0, "USB xHCI Host Controller"},
    ClassName{0x0100, 8, "SCSI Controller"},
    ClassName{0x0101, 8, "IDE Controller"},
    ClassName{0x0102, 8, "Floppy Disk Controller"},
    ClassName{0x0104, 8, "RAID Controller"},
    ClassName{0x0105, 8, "ATA Controller"},
    ClassName{0x0106, 8, "SATA Controller"},
    ClassName{0x0107, 8, "SAS Controller"},
    ClassName{0x0108, 8, "Non-Volatile Memory Controller"},
    ClassName{0x0200, 8, "Ethernet Controller"},
    ClassName{0x0280, 8, "Network Controller"},
    ClassName{0x0300, 8, "VGA Compatible Controller"},
    ClassName{0x0403, 8, "High Definition Audio Controller"},
    ClassName{0x0600, 8, "Host Bridge"},
    ClassName{0x0601, 8, "LPC/ISA Bridge"},
    ClassName{0x0604, 8, "PCI-to-PCI Bridge"},
    ClassName{0x0805, 8, "SD Host Controller"},
    ClassName{0x0C05, 8, "SMBus Controller"},
    ClassName{0x01, 16, "Mass Storage Controller"},
    ClassName{0x02, 16, "Network Controller"},
    ClassName{0x03, 16, "Display Controller"},
    ClassName{0x04, 16, "Multimedia Controller"},
    ClassName{0x05, 16, "Memory Controller"},
    ClassName{0x06, 16, "Bridge"},
    ClassName{0x07, 16, "Communication Controller"},
    ClassName{0x08, 16, "System Peripheral"},
    ClassName{0x0C, 16, "Serial Bus Controller"},
    ClassName{0x0D, 16, "Wireless Controller"},
};

}  // namespace

std::string DescriptionOf(const PciFunctionIds& identity) {
  const auto* const found = std::find_if(kNames.begin(), kNames.end(), [&](const ClassName& name) {
    return identity.classCode >> name.shift == name.code;
  });
  return std::string(found == kNames.end() ? std::string_view("PCI device") : found->name);
}

}  // namespace panelglow::platform::host_linux
