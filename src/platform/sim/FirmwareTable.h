// The firmware's structure table of a simulated machine, built from its description.
#pragma once

#include <cstdint>
#include <vector>

#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

/// The structures one behind the other, ended by the end-of-table structure. The raw table as it stands when the
/// description has one.
std::vector<std::uint8_t> BuildFirmwareTable(const FirmwareDescription& firmware);

/// The 64 KiB firmware segment at 0xF0000 with an entry point at its beginning and the table behind it.
std::vector<std::uint8_t> BuildFirmwareSegment(const FirmwareDescription& firmware);

inline constexpr std::uint32_t kFirmwareSegment = 0xF0000;

}  // namespace panelglow::platform::sim
