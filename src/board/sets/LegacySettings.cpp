#include "board/sets/LegacySettings.h"

namespace panelglow {

const char* TitleOf(LegacyDevice /*device*/) { return ""; }
LegacySettings LegacySettings::Load() { return {}; }

}  // namespace panelglow
