// Checks of the list of storage controllers, msctrl.ini.
#pragma once

#include <string>
#include <vector>

#include "boardtool/Finding.h"
#include "boardtool/IniOutline.h"

namespace panelglow::boardtool {

void CheckControllers(const IniOutline& file, Findings& findings);

/// The names that the file gives to controllers.
std::vector<std::string> ControllerNamesIn(const IniOutline& file);

}  // namespace panelglow::boardtool
