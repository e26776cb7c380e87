// Shows the front panel's time line as text: a row per LED over the whole run.
#pragma once

#include <string>

#include "controller/RunReport.h"

namespace panelglow::controller {

/// One row per LED with its name, colour and what drives it: '#' lit, '.' dark, '~' changing within the column's
/// span. Below it the operator's presses ('^'), the blinks counted, and whatever the run left changed. `columns` is
/// the width of the strip.
std::string ShowPanel(const RunReport& report, std::size_t columns);

}  // namespace panelglow::controller
