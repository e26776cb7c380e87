#include <cstdlib>

#include "boardtool/Installation.h"
#include "boardtool/Machine.h"
#include "platform/sim/SimHost.h"

namespace panelglow::boardtool {

bool IsSimulated() { return true; }

void UseMachine(const MachineOptions& options) {
  namespace sim = platform::sim;
  if (!options.file.empty()) {
    ::setenv(sim::kMachineVariable, options.file.c_str(), 1);
  }
  if (options.realTime) {
    ::setenv(sim::kRealTimeVariable, "1", 1);
  }
}

}  // namespace panelglow::boardtool
