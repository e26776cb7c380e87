// An embedded controller behind the two-port ACPI interface, with every command in the chip file. Serves the chip
// name "g_ec".
#pragma once

#include <cstdint>
#include <string>
#include <utility>

#include "board/chips/generic/GChip.h"
#include "board/parts/Sequence.h"

namespace panelglow {

class GEcChip : public GChip {
 public:
  GEcChip() : GEcChip("g_ec") {}

  /// Reads the chip's keys. Throws mblib_exception when the mandatory one is missing or a sequence is malformed.
  void Initialize() override;

  bool SaveFanState() override { return true; }
  bool RestoreFanState() override { return true; }
  bool EnterManualFanMode() override { return RunSequence(manualSetSequence); }
  bool LeaveManualFanMode() override { return RunSequence(manualResetSequence); }
  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;

  /// Without PWM registers in the file every fan number is served, by the command alone.
  bool SetFanPwm(int fan, int value) override;
  bool ReadTemperature(int zone, int& value) override;
  bool ReadLowLimitTemperature(int zone, int& value) override;

  bool IsPowerLedRedSupported(bool& supported) override;
  bool SavePowerLedState() override {
    const bool saved = RunSequence(powerSave);
    isPowerSaved = true;  // also by a sequence without entries; not by one that was interrupted
    return saved;
  }
  bool AssertPowerLedGreen() override { return RunSequence(powerGreenAssert); }
  bool AssertPowerLedRed() override { return RunSequence(powerRedAssert); }
  bool DeassertPowerLed() override { return RunSequence(powerDeassert); }
  /// Does nothing until there is a save.
  bool RestorePowerLedState() override { return !isPowerSaved || RunSequence(powerRestore); }

  // ---- the part's protocol. The waits give up silently after 4095 looks: a stuck controller makes for wrong data,
  // not for a hang.
  virtual std::uint8_t ReadEc2(std::uint8_t high, std::uint8_t low);
  virtual std::uint8_t ReadEc(std::uint8_t address);
  virtual bool ReservedOperation88() { return false; }
  virtual void WaitIbfClear();
  virtual void WaitObfSet();
  virtual bool ParseSequence(const Setting& setting, Sequence& sequence);

  /// True at once for an empty sequence.
  virtual bool RunSequence(const Sequence& sequence);

  /// A register of 0 is not sent; one below 0x100 as one byte.
  virtual void SetEcPwm(std::uint16_t reg, std::uint8_t value);
  virtual void LoadLedSequences();

 protected:
  explicit GEcChip(std::string chipName) : GChip(std::move(chipName)) {}

 private:
  void SendCommand(std::uint8_t command);
  void SendData(std::uint8_t data);

  std::uint8_t scPort = 0x66;  // status and command
  std::uint8_t dataPort = 0x62;
  std::uint8_t readCmd = 0x80;
  std::uint32_t ibfSleep = 0;  // ms, before each wait for the input buffer
  std::uint32_t obfSleep = 0;  // ms, before each wait for the output buffer
  std::uint8_t setPwmCmd = 0;
  Sequence manualSetSequence;
  Sequence manualResetSequence;
  Sequence powerRedAssert;
  Sequence powerGreenAssert;
  Sequence powerDeassert;
  Sequence powerSave;
  Sequence powerRestore;
  bool isPowerSaved = false;
};

}  // namespace panelglow
