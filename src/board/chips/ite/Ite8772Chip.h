// A Super-I/O of the ITE line whose fans 2 and 3 can be driven. Serves the chip name "ite_8772".
#pragma once

#include "board/chips/ite/Ite8758Chip.h"

namespace panelglow {

class Ite8772Chip : public Ite8758Chip {
 public:
  Ite8772Chip();
};

}  // namespace panelglow
