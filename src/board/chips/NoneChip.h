// The part that a board does not have: fills its place in the chip table and answers every operation as the base
// does. Serves the chip name "none".
#pragma once

#include "board/chips/Chip.h"

namespace panelglow {

class NoneChip : public Chip {
 public:
  NoneChip() : Chip("none") {}
};

}  // namespace panelglow
