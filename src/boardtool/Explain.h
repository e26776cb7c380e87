// The verb "explain": what the board library would do for a board's LEDs, request by request, and why.
#pragma once

#include <string>
#include <vector>

#include "boardtool/Installation.h"

namespace panelglow::boardtool {

struct ExplainOptions {
  std::string folder = ".";
  std::string systemId;
  std::string led;  // empty: all
  bool json = false;
};

/// Writes to standard output. Throws CannotRun and WrongCall. Returns the exit code: 0, or 1 when the files select no
/// board or one that cannot be built.
int Explain(const ExplainOptions& options);

/// The texts of a plan.
std::string ExplainText(const BoardPlan& plan, const std::vector<IniOutline>& files, bool allLeds);
std::string ExplainJson(const BoardPlan& plan, const std::vector<IniOutline>& files);

}  // namespace panelglow::boardtool
