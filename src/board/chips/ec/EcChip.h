// The older embedded controllers: fixed ports, fixed commands. Serves the chip name "ec"; the base of the others.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <utility>

#include "board/chips/Chip.h"

namespace panelglow {

class EcChip : public Chip {
 public:
  EcChip() : EcChip("ec") {}

  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
  bool SetFanPwm(int fan, int value) override;
  bool ReadTemperature(int zone, int& value) override;

  bool SavePowerLedState() override { return true; }
  bool AssertPowerLedGreen() override;
  bool AssertPowerLedRed() override;
  bool DeassertPowerLed() override;
  bool RestorePowerLedState() override;

 protected:
  explicit EcChip(std::string chipName) : Chip(std::move(chipName)) {}

  // The waits give up silently after 4096 looks.
  void WaitIbfClear();
  void WaitObfSet();
  virtual std::uint8_t ReadEc(std::uint8_t address);
  void WriteEcWord(std::uint16_t address, std::uint8_t value);

  /// A command and its data bytes, each behind a wait for the input buffer.
  void Send(std::uint8_t command, std::initializer_list<std::uint8_t> data);

  /// Reads what the controller has put into its output buffer.
  std::uint8_t TakeOutput();

 private:
  void SetPowerLed(std::uint8_t mode, std::uint8_t control);
};

}  // namespace panelglow
