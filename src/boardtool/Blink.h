// The verb "blink": blinks one LED of the machine as a test would, and asks nothing.
#pragma once

#include <string>

#include "boardtool/Machine.h"

namespace panelglow::boardtool {

struct BlinkOptions {
  std::string folder = ".";
  std::string led;
  int seconds = 0;  // 0: until a key is pressed
};

/// Says on standard error what it will touch, blinks, and puts everything back on every way out. Throws CannotRun and
/// WrongCall. Returns 0, or 1 when the board does not light the LED.
int Blink(const BlinkOptions& options, const Person& person);

}  // namespace panelglow::boardtool
