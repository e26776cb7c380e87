// The simulated machine of a whole program: described by environment variables that the reference controller sets.
#pragma once

#include <memory>

#include "platform/sim/Simulation.h"

namespace panelglow::platform::sim {

// What the reference controller hands over.
inline constexpr const char* kMachineVariable = "PANELGLOW_SIM_MACHINE";          // path of the machine's file
inline constexpr const char* kOperatorVariable = "PANELGLOW_SIM_OPERATOR";        // policy
inline constexpr const char* kSeedVariable = "PANELGLOW_SIM_SEED";                // decimal
inline constexpr const char* kFaultsVariable = "PANELGLOW_SIM_FAULTS";            // "LED=KIND" separated by ';'
inline constexpr const char* kRealTimeVariable = "PANELGLOW_SIM_REAL_TIME";       // "1"
inline constexpr const char* kWindowVariable = "PANELGLOW_SIM_WINDOW";            // "1"
inline constexpr const char* kScreenshotsVariable = "PANELGLOW_SIM_SCREENSHOTS";  // folder
inline constexpr const char* kTraceVariable = "PANELGLOW_SIM_TRACE";              // file for driver requests
inline constexpr const char* kReportVariable = "PANELGLOW_SIM_REPORT";            // file for the panel's time line

/// Builds the machine; ends the process with code 3 and a message on standard error when it cannot be built. Without
/// a machine's file it is a bare machine without driver, chips or person.
std::unique_ptr<Simulation> MakeSimulationFromEnvironment();

}  // namespace panelglow::platform::sim
