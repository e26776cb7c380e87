// What must hold of every run, as somebody sees it who stands outside of the program.
#pragma once

#include <string>
#include <vector>

#include "Case.h"

namespace panelglow::campaign {

/// What was seen of a run.
struct Seen {
  bool wasKilled = false;
  int exitCode = -1;
  std::string output = {};
  std::vector<std::string> changed = {};  // what is not as before: registers, lamps, disks, links, keys
  std::vector<std::string> locks = {};    // that are still held
  std::string logBefore = {};
  std::string log = {};
};

/// A sentence for each promise that was broken, which begins with the checker's name and a colon.
std::vector<std::string> Check(const Case& drawn, const Seen& seen);

/// True when every element is closed in its order and there is one root.
bool IsWellFormed(const std::string& xml);

}  // namespace panelglow::campaign
