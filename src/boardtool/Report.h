// The verb "report": everything about this machine that the suite can tell, for whoever is asked to help.
#pragma once

#include <string>

namespace panelglow::boardtool {

struct ReportOptions {
  std::string folder = ".";
  bool json = false;
};

/// Writes to standard output. What cannot be had is said to be missing, with the reason, and makes the report
/// incomplete. Returns 0 for a complete one, 1 otherwise.
int Report(const ReportOptions& options);

}  // namespace panelglow::boardtool
