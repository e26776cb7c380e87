#include "board/sets/TestButtons.h"

namespace panelglow {

bool TestButtons::Load() { return true; }
bool TestButtons::Select(const std::string& /*name*/) { return false; }
bool TestButtons::GetState(const std::string& /*name*/, bool& /*pressed*/) { return false; }
bool TestButtons::ReadDirect(bool& /*value*/) { return false; }
bool TestButtons::Read(bool& /*pressed*/) { return false; }
bool TestButtons::ReadLatch(bool& /*value*/) { return false; }

}  // namespace panelglow
