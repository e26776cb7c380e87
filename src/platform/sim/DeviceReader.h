// Reads the devices of a machine's file: controllers, disks, cameras, adapters, enumerated devices, libraries.
#pragma once

#include "platform/sim/DescriptionSection.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

/// To be called when the chips and the PCI functions have been read: names and places must be unique among all. A
/// controller with the usual id becomes a PCI function, too.
void ReadDevices(Section& root, MachineDescription& machine);

}  // namespace panelglow::platform::sim
