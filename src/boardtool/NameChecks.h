// Checks of the names in the board files: sections that nothing uses or that there are not, and keys that nothing
// reads.
#pragma once

#include <set>
#include <string>
#include <vector>

#include "boardtool/Finding.h"
#include "boardtool/Rehearsal.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

/// What the machines of the files came to when their boards were built.
struct Reached {
  std::set<LookUp> lookUps;
  std::set<std::string> unbuilt;        // machines without a board, in lower case
  std::vector<std::string> unselected;  // those of them that no file selects one for
};

void CheckNames(const std::vector<IniOutline>& files, const BoardFiles& names, platform::Host& machine,
                const Reached& reached, Findings& findings);

/// The text with the one of `known` that may be meant by `name`, where there is one.
std::string WithNearest(std::string text, const std::string& name, const std::vector<std::string>& known);

}  // namespace panelglow::boardtool
