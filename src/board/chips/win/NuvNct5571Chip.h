// A Nuvoton Super-I/O with three fans, whose LED pins are chosen by a multi-function register. Serves the chip name
// "nuv_nct5571".
#pragma once

#include "board/chips/win/NuvW83667Chip.h"

namespace panelglow {

class NuvNct5571Chip : public NuvW83667Chip {
 public:
  NuvNct5571Chip();
};

}  // namespace panelglow
