#include <cstdlib>
#include <set>

#include "boardtool/Installation.h"
#include "boardtool/Machine.h"
#include "platform/sim/SimHost.h"

namespace panelglow::boardtool {

bool IsSimulated() { return true; }

const char* ProgramName() { return "panelglow-board-sim"; }

void LetMachineNotice() { platform::sim::CurrentSimulation().Time().SleepFor(1); }

std::size_t PanelMark() { return platform::sim::CurrentSimulation().Panel().TimeLine().size(); }

std::string PanelMoves(std::size_t mark) {
  const platform::sim::FrontPanel& panel = platform::sim::CurrentSimulation().Panel();
  std::set<std::size_t> moved;
  for (std::size_t i = mark; i < panel.TimeLine().size(); ++i) {
    moved.insert(panel.TimeLine()[i].led);
  }
  std::string names;
  for (const std::size_t led : moved) {
    names += (names.empty() ? "" : ", ") + panel.Leds()[led].name;
  }
  return moved.empty() ? "nothing moves on the panel" : "on the panel moves " + names;
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
