// Runs a case on a simulated machine that lives in memory, in a child of this process: the program's own singletons
// are new for each, and a crash is the child's.
#pragma once

#include <string>
#include <vector>

#include "Case.h"

namespace panelglow::campaign {

/// Ways to break program, panel or machine on purpose, each of which one checker must notice.
struct Sabotage {
  const char* name;
  const char* checker;  // that notices it
};
const std::vector<Sabotage>& AllSabotages();

/// The promises that were broken. `sabotage` is empty, or a name of AllSabotages.
std::vector<std::string> Run(const Case& drawn, const Files& installation, const std::string& sabotage = {});

}  // namespace panelglow::campaign
