// A keyboard controller with fans and sensors of its own, whose duty register runs the other way. Serves the chip
// name "smsc_kbc1126".
#pragma once

#include <string>

#include "board/chips/ec/EcChip.h"

namespace panelglow {

class SmscKbc1126Chip : public EcChip {
 public:
  SmscKbc1126Chip();

  /// With "chip.smsc_kbc1126.runningaverage" set to "true" this takes ten samples, a second apart.
  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
  bool ReadFanRpm(int fan, int& rpm, int multiplier) override { return Chip::ReadFanRpm(fan, rpm, multiplier); }
  bool ReadFanRpmRaw(int fan, int& rpm, int multiplier) override;
  bool SetFanPwm(int fan, int value) override;
  bool SetFanFullSpeed(int fan) override;
  bool SetFanPwmPercent(int fan, int percent) override;
  bool SetManualFanMode(bool on) override;
  bool ReadTemperature(int zone, int& value) override;

  bool AssertPowerLedGreen() override;
  bool DeassertPowerLed() override;
  bool RestorePowerLedState() override { return AssertPowerLedGreen(); }

 protected:
  std::uint8_t ReadEc(std::uint8_t address) override;

 private:
  void WriteEc(std::uint8_t address, std::uint8_t value);
  std::uint32_t AverageTach(int fan, std::uint8_t address);

  bool runningAverage;
};

}  // namespace panelglow
