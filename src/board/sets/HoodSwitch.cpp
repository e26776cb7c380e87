#include "board/sets/HoodSwitch.h"

namespace panelglow {

bool HoodSwitch::Load() { return true; }
bool HoodSwitch::Read(bool& /*value*/) { return false; }
bool HoodSwitch::ReadLatch(bool /*clearFirst*/, bool& /*value*/) { return false; }

}  // namespace panelglow
