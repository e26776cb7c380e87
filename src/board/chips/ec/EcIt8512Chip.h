// An older embedded controller of the IT8512 kind: fans by commands, a power LED by commands without data. Serves the
// chip name "ec_it8512".
#pragma once

#include "board/chips/ec/EcChip.h"

namespace panelglow {

class EcIt8512Chip : public EcChip {
 public:
  EcIt8512Chip() : EcChip("ec_it8512") {}

  std::uint32_t ReadFanTach(int fan, int arg) override;
  bool SetFanPwm(int fan, int value) override;
  bool SetFanFullSpeed(int fan) override;
  bool ReadTemperature(int zone, int& value) override;
  bool AssertPowerLedGreen() override;
  bool AssertPowerLedRed() override;
  bool DeassertPowerLed() override;
  bool RestorePowerLedState() override { return AssertPowerLedGreen(); }

 private:
  void Write8512(std::uint16_t address, std::uint8_t value);
};

}  // namespace panelglow
