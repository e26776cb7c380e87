// The verb "try": brings up a board that nothing knows. It changes one bit or line of a chip after the other, asks
// which lamp moved, puts each back, and prints the sections that light what was found.
#pragma once

#include <string>

#include "boardtool/Machine.h"

namespace panelglow::boardtool {

struct TryOptions {
  std::string folder = ".";
  std::string chip;         // "g_iospace", "g_memoryspace", "g_ite" or "g_it8702"
  std::string at;           // port or address of the register, for the first two
  std::string bits;         // of the register; empty: all
  std::string lines;        // of the last two
  std::string systemId;     // of the sections; empty: the machine's
  bool isReplayed = false;  // a trace answers in place of the machine
};

/// The walk is on standard error, the sections on standard output. Throws CannotRun and WrongCall. Returns 0, or 1
/// when no lamp was found.
int Try(const TryOptions& options, const Person& person);

}  // namespace panelglow::boardtool
