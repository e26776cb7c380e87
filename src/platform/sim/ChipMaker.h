// Makes the chips of a simulated machine.
#pragma once

#include <memory>

#include "platform/sim/MachineDescription.h"
#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// `time` stays with the caller. Throws MachineError when there is no such kind.
std::unique_ptr<Device> MakeChip(const ChipDescription& chip, const Scheduler& time);

}  // namespace panelglow::platform::sim
