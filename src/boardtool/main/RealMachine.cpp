#include "boardtool/Installation.h"
#include "boardtool/Machine.h"

namespace panelglow::boardtool {

bool IsSimulated() { return false; }

const char* ProgramName() { return "panelglow-board"; }

std::size_t PanelMark() { return 0; }

std::string PanelMoves(std::size_t /*mark*/) { return {}; }

void LetMachineNotice() {}

void UseMachine(const MachineOptions& options) {
  if (!options.file.empty() || options.realTime) {
    throw WrongCall("this program works on the machine that it runs on; panelglow-board-sim takes --machine");
  }
}

}  // namespace panelglow::boardtool
