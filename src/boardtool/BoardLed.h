// The LEDs that the board library drives, each with the operations that the tests' workers call for it.
#pragma once

#include <span>
#include <string_view>

#include "board/MotherBoard.h"

namespace panelglow::boardtool {

using BoardOperation = bool (MotherBoard::*)();

struct BoardLed {
  std::string_view id;          // as people type it
  std::string_view title;       // as people read it
  std::string_view function;    // its key in buttondefinition.xml
  std::string_view chipKey;     // names the chip that drives it
  std::string_view chipPrefix;  // how its keys in a chip's section begin; empty: it has none of its own
  BoardOperation save;
  BoardOperation blink;  // null: none
  BoardOperation on;
  BoardOperation off;
  BoardOperation restore;
};

std::span<const BoardLed> BoardLeds();

/// By its id, or by the name of its other colour: "power-white" is "power-green". Null when there is none.
const BoardLed* FindBoardLed(std::string_view id);

/// All ids, by commas.
std::string BoardLedNames();

}  // namespace panelglow::boardtool
