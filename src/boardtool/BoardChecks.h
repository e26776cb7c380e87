// Checks of the board files by running the board library for every machine that they know.
#pragma once

#include <set>
#include <string>
#include <vector>

#include "boardtool/Finding.h"
#include "boardtool/Installation.h"
#include "boardtool/Rehearsal.h"

namespace panelglow::boardtool {

/// Machines beyond these are not tried, so that no file keeps a check busy for ever.
inline constexpr std::size_t kMostMachines = 200;

/// What the checks of other files need to know.
struct BoardKnowledge {
  std::set<std::string, std::less<>> litFunctions;  // function keys of LEDs that some board lights
};

BoardKnowledge CheckBoards(const std::vector<IniOutline>& files, const BoardFiles& names, platform::Host& machine,
                           Findings& findings);

}  // namespace panelglow::boardtool
