// What all generic chips share: no registers of their own, everything read from the chip file. A new platform needs
// new text there and no new code. Serves the chip name "g_chip".
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "board/chips/Chip.h"
#include "board/parts/SavedRegisters.h"

namespace panelglow {

class GChip : public Chip {
 public:
  GChip() : GChip("g_chip") {}

  bool SetManualFanMode(bool on) override;

  /// Fan 0 or less means every fan.
  bool SetFanFullSpeed(int fan) override;
  bool SetFanPwmPercent(int fan, int percent) override;

  virtual void LoadFanConfiguration();
  virtual void LoadTemperatureConfiguration();
  virtual void LoadPowerLedConfiguration();

  virtual bool EnterManualFanMode() { return false; }
  virtual bool LeaveManualFanMode() { return false; }

 protected:
  explicit GChip(std::string chipName) : Chip(std::move(chipName)) {}

  /// Set-up common to the generic classes: the section, then the three families of keys.
  void LoadConfiguration();

  /// The numbers of "<prefix>.1.<suffix>", "<prefix>.2.<suffix>", ... up to the first 0, or up to the number under
  /// `countKey` when that is not 0.
  template <class Number>
  [[nodiscard]] std::vector<Number> ReadNumberedList(const std::string& countKey, const std::string& prefix,
                                                     const std::string& suffix) const;

  std::string section;  // chip file section; empty until loaded
  SavedRegisters savedFans;
  std::vector<std::uint8_t> fanSaveRegs;
  std::uint32_t fanRestoreSleep = 0;  // ms
  std::vector<std::uint32_t> tachRegs;
  std::vector<std::uint16_t> pwmRegs;
  std::uint8_t fullSpeedData = 255;
  std::vector<std::uint16_t> tempReadRegs;
  std::vector<std::uint16_t> tempLimitRegs;
  std::uint8_t powerLedLdn = 0;
  std::vector<std::uint8_t> powerLedStateRegs;
  SavedRegisters savedPowerLed;
};

}  // namespace panelglow
