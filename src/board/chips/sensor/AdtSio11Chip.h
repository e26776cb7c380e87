// As "adt", with more of its fans' registers, at another address. Serves the chip name "adt_sio11".
#pragma once

#include "board/chips/sensor/AdtChip.h"

namespace panelglow {

class AdtSio11Chip : public AdtChip {
 public:
  AdtSio11Chip();

  /// 0 for a register that there is not, or that does not answer.
  int ReadRegister(int reg) override;
};

}  // namespace panelglow
