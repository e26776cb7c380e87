// A Fintek Super-I/O whose LED pins have a logical device of their own. Serves the chip name "fin_f71808a".
#pragma once

#include "board/chips/fin/FinChip.h"

namespace panelglow {

class FinF71808aChip : public FinChip {
 public:
  FinF71808aChip();

  /// The fans go back to automatic mode before they get their values.
  bool RestoreFanState() override;
};

}  // namespace panelglow
