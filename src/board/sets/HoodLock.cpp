#include "board/sets/HoodLock.h"

namespace panelglow {

bool HoodLock::Load() { return true; }
bool HoodLock::Read(bool& /*present*/) { return false; }
int HoodLock::Lock() { return 0; }
int HoodLock::Unlock() { return 0; }

}  // namespace panelglow
