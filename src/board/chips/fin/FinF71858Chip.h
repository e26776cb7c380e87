// A Fintek Super-I/O with eight temperature zones, one of which may be a processor's own reading, and its LED in
// device 1. Serves the chip name "fin_f71858".
#pragma once

#include <string>

#include "board/chips/fin/FinCurveChip.h"

namespace panelglow {

class FinF71858Chip : public FinCurveChip {
 public:
  FinF71858Chip();

  bool ReadTemperature(int zone, int& value) override;

 protected:
  /// For a derived class, which then reads its own keys and sets its LED.
  explicit FinF71858Chip(std::string chipName);

  RegisterFile& LedRegisters() override { return config; }
};

}  // namespace panelglow
