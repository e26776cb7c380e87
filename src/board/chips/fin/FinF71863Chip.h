// A Fintek Super-I/O whose LED blinks by lists of configuration registers from the files. Serves the chip name
// "fin_f71863".
#pragma once

#include "board/chips/fin/FinChip.h"

namespace panelglow {

class FinF71863Chip : public FinChip {
 public:
  /// Throws mblib_exception for a list that is none.
  FinF71863Chip();
};

}  // namespace panelglow
