// A generic embedded controller whose tachometers count revolutions per minute already. Serves the chip name
// "g_ec_it8519".
#pragma once

#include "board/chips/generic/GEcChip.h"
#include "board/parts/RpmOf.h"

namespace panelglow {

class GEcIt8519Chip : public GEcChip {
 public:
  GEcIt8519Chip() : GEcChip("g_ec_it8519") {}

  int TachToRpm(std::uint32_t raw, int /*multiplier*/) override {
    return raw >= kTachStopped ? 0 : static_cast<int>(raw);
  }
};

}  // namespace panelglow
