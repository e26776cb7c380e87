// Checks of the list of storage controllers, msctrl.ini.
#pragma once

#include "boardtool/Finding.h"
#include "boardtool/IniOutline.h"

namespace panelglow::boardtool {

void CheckControllers(const IniOutline& file, Findings& findings);

}  // namespace panelglow::boardtool
