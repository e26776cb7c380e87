// What one operator test's dialog does otherwise than the other's.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/Text.h"

namespace panelglow {

/// One icon-and-button pair of the grid.
struct DialogButton {
  std::string icon;  // file
  wstring caption;
  int command = 0;
};

/// The kinds of LED that a button is the right answer for, in the order in which they are tried. kFirstHdGreen stands
/// for all drive entries by controller. None: the button is always a wrong answer.
struct ButtonAnswer {
  std::uint32_t button = 0;
  std::vector<std::int32_t> kinds;
};

struct DialogRules {
  std::vector<DialogButton> buttons;  // in grid order, row by row
  std::vector<ButtonAnswer> answers;  // a button that is not here does nothing
  bool startsByItself = true;         // otherwise the operator presses the start button, and no time runs before
  bool writesLines = true;            // log lines of workers and of the waits for them
  bool waitsForUnstarted = false;     // waits for every entry, and not only where a worker counts as started
};

}  // namespace panelglow
