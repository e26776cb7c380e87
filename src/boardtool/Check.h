// The verb "check": what is wrong with an installation's files, said with file, line and column.
#pragma once

#include <string>
#include <vector>

#include "boardtool/Finding.h"
#include "platform/Host.h"

namespace panelglow::boardtool {

struct CheckOptions {
  std::string folder = ".";
  std::vector<std::string> files;  // only these are told of; none: all of the folder
  std::string format = "text";     // or "json", "sarif"
};

/// All findings of an installation that no comment silences. `machine` lends the services for pictures and XML.
std::vector<Finding> FindingsOf(const CheckOptions& options, platform::Host& machine);

/// Writes the findings to standard output. Throws CannotRun. Returns 0 for a clean installation, 1 with findings.
int Check(const CheckOptions& options);

}  // namespace panelglow::boardtool
