// A Fintek Super-I/O with its LED in one multi-function select. Serves the chip name "fin_f8000".
#pragma once

#include "board/chips/fin/FinCurveChip.h"

namespace panelglow {

class FinF8000Chip : public FinCurveChip {
 public:
  FinF8000Chip();

  /// What the part makes of the values that it is given back is what the next restore writes.
  bool RestoreFanState() override;
};

}  // namespace panelglow
