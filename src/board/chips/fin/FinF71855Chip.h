// A Fintek Super-I/O that blinks its LED by itself, by a mode register of device 1. Serves the chip name
// "fin_f71855".
#pragma once

#include "board/chips/fin/FinCurveChip.h"

namespace panelglow {

class FinF71855Chip : public FinCurveChip {
 public:
  FinF71855Chip();

 protected:
  RegisterFile& LedRegisters() override { return config; }
};

}  // namespace panelglow
