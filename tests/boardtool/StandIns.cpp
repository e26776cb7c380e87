// The machine of the tests, where the program has its own.
#include "boardtool/Machine.h"

namespace panelglow::boardtool {

bool IsSimulated() { return true; }

const char* ProgramName() { return "panelglow-board-sim"; }

std::size_t PanelMark() { return 0; }

std::string PanelMoves(std::size_t /*mark*/) { return {}; }

}  // namespace panelglow::boardtool
