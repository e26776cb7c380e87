#include "boardtool/Installation.h"
#include "boardtool/Machine.h"

namespace panelglow::boardtool {

bool IsSimulated() { return false; }

std::string PanelNow() { return {}; }

void LetMachineNotice() {}

void UseMachine(const MachineOptions& options) {
  if (!options.file.empty() || options.realTime) {
    throw WrongCall("this program works on the machine that it runs on; panelglow-board-sim takes --machine");
  }
}

}  // namespace panelglow::boardtool
