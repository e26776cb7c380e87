// One hardware part of a board, seen through one wide interface: fans, temperatures, GPIO lines, the power button,
// and each front-panel LED. The base gives a neutral negative answer to every operation; a chip class overrides what
// its silicon can do. Serves the chip name "chip".
//
// Operations return true when the part can do what was asked; false means that the platform has no such thing and
// changes nothing. A chip is one board's and one thread's.
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/parts/Lines.h"
#include "board/parts/PowerButton.h"
#include "hw/CDevio.h"

namespace panelglow {

class Chip {
 public:
  // States of a GPIO line.
  static constexpr int kAsserted = kLineAsserted;
  static constexpr int kNotAsserted = kLineNotAsserted;
  static constexpr int kNoSuchLine = kNoSuchLineState;

  Chip();
  virtual ~Chip() = default;
  Chip(const Chip&) = delete;
  Chip& operator=(const Chip&) = delete;

  /// Second stage of construction for the classes whose set-up talks to the hardware.
  virtual void Initialize() {}

  // ---- fans; numbers count from 1 in the generic classes
  virtual bool ReadFanRpm(int fan, int& rpm, int multiplier);
  virtual bool SaveFanState() { return false; }
  virtual bool RestoreFanState() { return false; }
  virtual bool SetManualFanMode(bool /*on*/) { return false; }
  virtual bool ReadFanRpmRaw(int fan, int& rpm, int multiplier);
  virtual std::uint32_t ReadFanTach(int /*fan*/, int /*arg*/) { return 0; }
  virtual int TachToRpm(std::uint32_t raw, int multiplier);
  virtual bool SetFanFullSpeed(int /*fan*/) { return false; }
  virtual bool SetFanPwmPercent(int fan, int percent);
  virtual bool SetFanPwm(int /*fan*/, int /*value*/) { return false; }
  virtual void SaveFanControl(int /*fan*/) {}
  virtual void TakeFanControl(int /*fan*/) {}
  virtual void RestoreFanControl(int /*fan*/) {}

  // ---- temperatures, degrees Celsius

  /// A processor's temperature: with `allCores` the mean of its cores, which GetCoreTemperatures then gives one by
  /// one; else that of its first core.
  virtual bool ReadProcessorTemperature(int /*zone*/, int& /*value*/, bool /*allCores*/,
                                        const std::string& /*zoneName*/) {
    return false;
  }

  /// The cores of the last ReadProcessorTemperature with `allCores`; empty when it read none.
  [[nodiscard]] virtual std::vector<int> GetCoreTemperatures() const { return {}; }
  virtual bool ReadVirtualTemperature(int /*zone*/, bool /*flag*/, int& /*value*/) { return false; }
  virtual bool ReadTemperature(int /*zone*/, int& /*value*/) { return false; }
  virtual bool ReadLowLimitTemperature(int /*zone*/, int& /*value*/) { return false; }
  virtual bool ReadThreshold(int /*zone*/, int& /*value*/) { return false; }
  virtual int MapTemperature(int raw) { return raw; }

  /// The graphics cards whose temperatures it reads, each a zone from 0.
  virtual int CountCards() { return 0; }
  virtual void ReservedOperation21() {}

  /// A register of the hardware monitor; where it has banks, the bank stands in the high byte of the number.
  virtual bool ReadEnvironmentRegister(std::uint16_t /*reg*/, std::uint8_t& /*value*/) { return false; }

  // ---- lines, switches, locks

  /// A bit (0 to 7) of a configuration register of a logical device.
  virtual bool ReadConfigBit(std::uint8_t ldn, std::uint8_t reg, int bit, bool& value);
  virtual bool ReadIntrusionLatch(int /*line*/, bool /*clearFirst*/, bool& /*value*/) { return false; }

  /// With `check` the line must show the lock's new state for the result to be true.
  virtual bool LockHood(int /*line*/, bool /*check*/) { return false; }
  virtual bool UnlockHood(int /*line*/, bool /*check*/) { return false; }
  virtual int ReadLineByNames(std::uint32_t /*offset*/, const std::string& /*bitName*/,
                              const std::string& /*clearBitName*/) {
    return 0;
  }
  virtual int ReadLine(int /*line*/) { return 0; }
  virtual int ReadLineDirect(int /*line*/) { return 0; }
  virtual bool ReadLineActivity(int /*line*/, int& /*value*/) { return false; }

  // ---- power button, in the chipset's power management registers
  virtual bool SavePowerButtonState();
  virtual bool ArmPowerButton();
  virtual bool IsPowerButtonPressed(bool& pressed);
  virtual bool RestorePowerButtonState();

  // ---- power LED
  virtual bool IsPowerLedRedSupported(bool& /*supported*/) { return false; }
  virtual bool SavePowerLedState() { return false; }
  virtual bool AssertPowerLedGreen() { return false; }
  virtual bool AssertPowerLedRed() { return false; }
  virtual bool DeassertPowerLed() { return false; }
  virtual bool RestorePowerLedState() { return false; }
  virtual bool BlinkPowerLedGreen() { return false; }
  virtual bool BlinkPowerLedRed() { return false; }

  // ---- charge LED
  virtual bool IsChargeLedRedSupported(bool& /*supported*/) { return false; }
  virtual bool AssertChargeLedWhite() { return false; }
  virtual bool DeassertChargeLedWhite() { return false; }
  virtual bool AssertChargeLedRed() { return false; }
  virtual bool DeassertChargeLedRed() { return false; }
  virtual bool BlinkChargeLedWhite() { return false; }
  virtual bool BlinkChargeLedRed() { return false; }
  virtual bool SaveChargeLedState() { return false; }
  virtual bool RestoreChargeLedState() { return false; }

  // ---- hard-drive LED
  virtual bool IsHdLedRedSupported(bool& /*supported*/) { return false; }
  virtual void ReservedOperation53() {}
  virtual bool SaveHdLedState() { return false; }
  virtual bool RestoreHdLedState() { return false; }
  virtual bool AssertHdLedRed() { return false; }
  virtual bool DeassertHdLedRed() { return false; }
  virtual bool BlinkHdLedRed() { return false; }

  // ---- wireless LED
  virtual bool IsWirelessLedSupported(bool& /*supported*/) { return false; }
  virtual bool SaveWirelessLedState() { return false; }
  virtual bool RestoreWirelessLedState() { return false; }
  virtual bool AssertWirelessLed() { return false; }
  virtual bool DeassertWirelessLed() { return false; }

  // ---- speaker and microphone LEDs
  virtual bool SaveSpeakerLedState() { return false; }
  virtual bool RestoreSpeakerLedState() { return false; }
  virtual bool BlinkSpeakerLed() { return false; }
  virtual bool BlinkMicrophoneLed() { return false; }
  virtual bool AssertSpeakerLed() { return false; }
  virtual bool DeassertSpeakerLed() { return false; }
  virtual bool AssertMicrophoneLed() { return false; }
  virtual bool DeassertMicrophoneLed() { return false; }

  // ---- latched status ports; asked by mask, which is what the keys of the test buttons hold

  /// Reads a status byte whose set bits are cleared by writing them back; `value` is whether one of the mask was set.
  virtual bool ReadLatchedPort(std::uint16_t port, std::uint32_t mask, bool& value);
  virtual bool ReadLatchedPortDword(std::uint16_t port, std::uint32_t mask, bool& value);
  virtual bool ClearLatchedPortDword(std::uint16_t port, std::uint32_t mask);

  // ---- others

  /// Asserted when the line follows the pin of the network controller of these ids, as a cable makes it; kNoSuchLine
  /// when the line or the controller cannot be reached.
  virtual int ReadDashCable(int /*line*/, const std::string& /*idList*/) { return kNoSuchLine; }
  bool DetectDashCable(int line, const std::string& idList) { return ReadDashCable(line, idList) == kAsserted; }
  virtual int ReadRegister(int /*reg*/) { return 0; }
  virtual bool ReservedOperation77() { return false; }

  [[nodiscard]] const std::string& GetName() const { return name; }

  /// Whether SetManualFanMode has given its fans to software.
  [[nodiscard]] bool IsFanModeManual() const { return manualFanMode; }

 protected:
  /// `chipName` is the name in the class table.
  explicit Chip(std::string chipName);

  CDevio& devio;
  std::string name;
  bool manualFanMode = false;    // fans are under software control
  std::uint32_t lastStatus = 0;  // last value of a latched status read

 private:
  PowerButton powerButton;
};

}  // namespace panelglow
