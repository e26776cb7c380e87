// A Fintek Super-I/O that has a register for each colour of its LED, in device 10. Serves the chip name
// "fin_f71808e".
#pragma once

#include "board/chips/fin/FinF71858Chip.h"

namespace panelglow {

class FinF71808eChip : public FinF71858Chip {
 public:
  FinF71808eChip();
};

}  // namespace panelglow
