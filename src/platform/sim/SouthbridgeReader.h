// Reads the parts of a southbridge from a machine's file.
#pragma once

#include "platform/sim/DescriptionSection.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

PortRegistersSetup ReadPortRegisters(Section& section);

SmbusHostSetup ReadSmbusHost(Section& section);

}  // namespace panelglow::platform::sim
