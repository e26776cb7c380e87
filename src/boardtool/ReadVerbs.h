// The verbs "fans", "zones" and "detect": the library's own readings of this machine.
#pragma once

#include <string>

#include "boardtool/Machine.h"

namespace panelglow::boardtool {

struct ReadOptions {
  std::string folder = ".";
  bool json = false;
  bool watch = false;   // again and again until a key is pressed or the run is to end
  int rounds = 0;       // of watching; 0: no limit
  std::string logFile;  // of "fans" and "zones": the test's log; its XML results go to the same name with ".xml"
};

// Each throws CannotRun. Returns 0, or 1 when something is not as it should be.
int Fans(const ReadOptions& options, const Person& person);
int Zones(const ReadOptions& options, const Person& person);
int Detect(const ReadOptions& options, const Person& person);

}  // namespace panelglow::boardtool
