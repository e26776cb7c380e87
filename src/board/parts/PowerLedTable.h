// What a chip's power LED is, as steps on registers.
#pragma once

#include <optional>
#include <vector>

#include "board/parts/Step.h"

namespace panelglow {

/// An operation without steps answers false; one whose list is empty has nothing to do and is true.
struct PowerLedTable {
  std::vector<RegisterId> saved = {};
  Steps prepared = {};  // for the LED to have its pins: each is done at once when its register is saved
  std::vector<RegisterId> restored = {};  // in this order; empty: as saved
  std::optional<Steps> green = {};
  std::optional<Steps> red = {};
  std::optional<Steps> off = {};
  std::optional<Steps> blinkGreen = {};
  std::optional<Steps> blinkRed = {};
  bool isRedSupported = false;  // false: the class does not say
};

}  // namespace panelglow
