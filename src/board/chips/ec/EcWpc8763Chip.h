// An older embedded controller with one-byte tachometers. Serves the chip name "ec_wpc8763".
#pragma once

#include "board/chips/ec/EcChip.h"

namespace panelglow {

class EcWpc8763Chip : public EcChip {
 public:
  EcWpc8763Chip() : EcChip("ec_wpc8763") {}

  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
};

}  // namespace panelglow
