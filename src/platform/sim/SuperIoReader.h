// Reads the tables of a plain Super-I/O, and plain registers, from a machine's file.
#pragma once

#include "platform/sim/DescriptionSection.h"
#include "platform/sim/MachineDescription.h"

namespace panelglow::platform::sim {

/// An LED pin with a mode.
SuperIoLed ReadLedPin(Section& section);

SuperIoTables ReadSuperIoTables(Section& section);

IndexedRegistersSetup ReadIndexedRegisters(Section& section);

}  // namespace panelglow::platform::sim
