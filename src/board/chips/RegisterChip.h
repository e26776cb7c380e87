// A chip of the older kind: its registers stand in code, as tables. What follows from a table follows here, in the
// order of the table's rows; a class overrides what its part does otherwise. An operation whose table is empty
// answers as Chip does.
#pragma once

#include <optional>
#include <string>

#include "board/chips/Chip.h"
#include "board/parts/FanTable.h"
#include "board/parts/PowerLedTable.h"
#include "board/parts/SavedRegisters.h"
#include "board/parts/ZoneTable.h"

namespace panelglow {

class RegisterChip : public Chip {
 public:
  // ---- fans. Their registers are saved once, and stay saved behind a restore.
  bool SaveFanState() override;
  bool RestoreFanState() override;
  bool SetManualFanMode(bool on) override;
  std::uint32_t ReadFanTach(int fan, int arg) override;
  bool SetFanFullSpeed(int fan) override;
  bool SetFanPwm(int fan, int value) override;

  // ---- temperatures
  bool ReadTemperature(int zone, int& value) override;
  bool ReadLowLimitTemperature(int zone, int& value) override;

  // ---- power LED. Saved once; a restore without a save does nothing, and is the end of the save.
  bool IsPowerLedRedSupported(bool& supported) override;
  bool SavePowerLedState() override;
  bool AssertPowerLedGreen() override { return RunLed(led.green); }
  bool AssertPowerLedRed() override { return RunLed(led.red); }
  bool DeassertPowerLed() override { return RunLed(led.off); }
  bool RestorePowerLedState() override;
  bool BlinkPowerLedGreen() override { return RunLed(led.blinkGreen); }
  bool BlinkPowerLedRed() override { return RunLed(led.blinkRed); }

 protected:
  explicit RegisterChip(std::string chipName);

  /// Where the registers of the tables `fans` and `zones` are.
  virtual RegisterFile& Monitor() = 0;

  /// Where those of the table `led` are.
  virtual RegisterFile& LedRegisters() = 0;

  /// What stands in a duty register for a duty of 0 to 255.
  [[nodiscard]] virtual std::uint8_t DutyOf(int value) const;

  /// Sets the duty of one fan; false for a fan without a row.
  virtual bool WriteDuty(int fan, int value);

  bool RunLed(const std::optional<Steps>& steps);

  // Filled by the constructors.
  FanTable fans;
  ZoneTable zones;
  PowerLedTable led;

  SavedRegisters savedFans;
  SavedRegisters savedLed;

 private:
  void TakeLed();
  std::uint32_t ReadPair(const RegisterPair& pair, PairOrder order);
};

}  // namespace panelglow
