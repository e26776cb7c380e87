// The machine of the tests, where the program has its own.
#include "boardtool/Machine.h"

namespace panelglow::boardtool {

bool IsSimulated() { return true; }

std::string PanelNow() { return {}; }

}  // namespace panelglow::boardtool
