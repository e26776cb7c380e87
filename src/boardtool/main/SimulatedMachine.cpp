#include <cstdlib>

#include "boardtool/Installation.h"
#include "boardtool/Machine.h"
#include "platform/sim/SimHost.h"

namespace panelglow::boardtool {

bool IsSimulated() { return true; }

void LetMachineNotice() { platform::sim::CurrentSimulation().Time().SleepFor(1); }

std::string PanelNow() {
  const platform::sim::FrontPanel& panel = platform::sim::CurrentSimulation().Panel();
  std::string lit;
  for (std::size_t i = 0; i < panel.Leds().size(); ++i) {
    lit += panel.IsLit(i) ? (lit.empty() ? "" : ", ") + panel.Leds()[i].name : "";
  }
  return "the panel shows " + (lit.empty() ? "nothing" : lit) + " lit";
}

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
