// The firmware's structure table of the real machine.
#pragma once

#include <cstdint>
#include <vector>

#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

/// The table as the kernel found it, which only root may read; without that right, one made of the fields that the
/// kernel shows to everybody: BIOS, system, board and enclosure, with neither serial numbers nor UUID nor processors.
/// Empty when there is neither.
std::vector<std::uint8_t> ReadFirmwareTable(const KernelFolders& folders);

}  // namespace panelglow::platform::host_linux
