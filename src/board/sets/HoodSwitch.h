// The switch that tells whether the machine's hood is open: as a line, and as a latch that remembers.
#pragma once

#include <cstdint>
#include <string>
#include <utility>

#include "board/sets/ChipFinder.h"

namespace panelglow {

class HoodSwitch {
 public:
  explicit HoodSwitch(ChipFinder finder) : chipOf(std::move(finder)) {}

  bool Load();

  /// Whether the switch is there, or closed, as the line is wired. False, and `value` stays, without a line.
  bool Read(bool& value);

  /// Whether the hood was opened; `clearFirst` makes the chip forget what was before. False, and `value` stays, when
  /// nothing is loaded or the chip cannot tell.
  bool ReadLatch(bool clearFirst, bool& value);

 private:
  ChipFinder chipOf;
};

}  // namespace panelglow
