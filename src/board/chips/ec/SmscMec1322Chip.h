// An embedded controller behind a mailbox: an index and a data port with pages, slow to answer; its LEDs by lists of
// port writes in the chip file. Serves the chip name "smsc_mec1322".
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/chips/ec/EcChip.h"

namespace panelglow {

class SmscMec1322Chip : public EcChip {
 public:
  /// Finds the configuration port, and reads the chip's keys. Throws mblib_exception for a malformed list.
  SmscMec1322Chip();

  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
  bool SetManualFanMode(bool on) override;
  bool SetFanPwm(int fan, int value) override;
  // As a chip without zones: those of the base are another part's. NOLINTNEXTLINE(bugprone-parent-virtual-call)
  bool ReadTemperature(int zone, int& value) override { return Chip::ReadTemperature(zone, value); }

  bool AssertPowerLedGreen() override { return RunList(kPowerGreenAssert); }
  bool DeassertPowerLed() override { return RunList(kPowerGreenDeassert); }
  bool SavePowerLedState() override;
  bool RestorePowerLedState() override;

  bool AssertChargeLedWhite() override { return RunList(kChargeGreenAssert); }
  bool DeassertChargeLedWhite() override { return RunList(kChargeGreenDeassert); }
  bool AssertChargeLedRed() override { return RunList(kChargeRedAssert); }
  bool DeassertChargeLedRed() override { return RunList(kChargeRedDeassert); }
  bool SaveChargeLedState() override;
  bool RestoreChargeLedState() override;

 private:
  enum List : std::size_t {
    kPowerGreenAssert,
    kPowerGreenDeassert,
    kPowerGreenSaveMux,
    kPowerGreenEnableMux,
    kChargeGreenAssert,
    kChargeGreenDeassert,
    kChargeGreenSaveMux,
    kChargeGreenEnableMux,
    kChargeRedAssert,
    kChargeRedDeassert,
    kChargeRedSaveMux,
    kChargeRedEnableMux,
    kListCount
  };
  using PortList = std::vector<std::pair<std::uint16_t, std::uint8_t>>;

  bool RunList(List which);
  bool SaveMux(List which);
  void RestoreMux(List which);

  // The mailbox.
  void WriteMailbox(std::uint8_t reg, std::uint8_t value);
  void SelectPage(std::uint8_t high, std::uint8_t low);
  void SetAddress(std::uint8_t high, std::uint8_t low);
  std::uint8_t ReadByte();
  void WriteByte(std::uint8_t value);
  std::uint8_t ReadFanPage(std::uint8_t low);

  std::array<PortList, kListCount> lists;
  std::uint32_t waitTime;  // ms, behind each write of a list
  std::uint8_t savedMux = 0;
  std::uint8_t savedMuxRed = 0;
  std::uint8_t savedMuxGreen = 0;  // of the charge LED; kept too, so that putting back can be begun again
  bool isPowerLedTaken = false;    // by a save; a multiplexer is saved where the files say how
  bool isPowerMuxSaved = false;
  bool isChargeRedMuxSaved = false;
  bool isChargeGreenMuxSaved = false;
};

}  // namespace panelglow
