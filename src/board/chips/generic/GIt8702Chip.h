// A generic Super-I/O of the IT8702 kind: the duty registers take half the scale, and four registers keep the fans in
// automatic mode. Serves the chip name "g_it8702".
#pragma once

#include <cstdint>

#include "board/chips/generic/GIteChip.h"

namespace panelglow {

class GIt8702Chip : public GIteChip {
 public:
  GIt8702Chip() : GIteChip("g_it8702") {}

  void Initialize() override;
  bool EnterManualFanMode() override;

  /// The first register starts the monitor: its value is written last, with the start bit.
  bool RestoreFanState() override;
  bool SetFanPwm(int fan, int value) override;

 protected:
  [[nodiscard]] std::string FanIntegrityText() const override;

 private:
  std::uint8_t configReg = 0;
  std::uint8_t fanMainControlReg = 0;
  std::uint8_t fanControlReg = 0;
  std::uint8_t fanRampRateReg = 0;
};

}  // namespace panelglow
