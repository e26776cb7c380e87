// Reads the description of a chip from a machine's file.
#pragma once

#include "platform/sim/DescriptionSection.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

ChipDescription ReadChip(Section& section);

FirmwareCallSetup ReadFirmwareCall(Section& section);

}  // namespace panelglow::platform::sim
