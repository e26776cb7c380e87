// An older embedded controller of the IT8518 kind, with lines that can be read by name. Serves the chip name
// "ec_it8518".
#pragma once

#include "board/chips/ec/EcChip.h"

namespace panelglow {

class EcIt8518Chip : public EcChip {
 public:
  EcIt8518Chip() : EcChip("ec_it8518") {}

  std::uint32_t ReadFanTach(int fan, int arg) override;
  bool ReadTemperature(int zone, int& value) override;

  /// A bit of a register; with `clearBitName` that bit is pulsed first. Bits are named by their number.
  int ReadLineByNames(std::uint32_t offset, const std::string& bitName, const std::string& clearBitName) override;

  bool AssertPowerLedGreen() override { return SetPowerLed(2); }
  bool AssertPowerLedRed() override { return SetPowerLed(1); }
  bool DeassertPowerLed() override { return SetPowerLed(0); }
  bool RestorePowerLedState() override { return AssertPowerLedGreen(); }

 private:
  bool SetPowerLed(std::uint8_t mode);
};

}  // namespace panelglow
