// A Super-I/O of the Winbond line with its registers in code: a hardware monitor with banks, tachometers with
// divisors, GPIO groups that the files may describe, and the LED and the power button in configuration registers.
// Serves the chip name "win"; the base of its family.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "board/chips/RegisterChip.h"
#include "board/chips/win/WinMonitor.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/EachAccess.h"

namespace panelglow {

class WinChip : public RegisterChip {
 public:
  WinChip();

  /// The count times its divisor.
  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;

  bool ReadTemperature(int zone, int& value) override;
  int MapTemperature(int raw) override;

  /// A line's tens are its group, its units the bit. Makes all lines of the group inputs.
  int ReadLine(int line) override { return ReadGroup(line, &GpioGroup::data); }

  /// As ReadLine, from the group's status register.
  int ReadLineDirect(int line) override { return ReadGroup(line, &GpioGroup::status); }

  bool SavePowerButtonState() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;
  bool RestorePowerButtonState() override;

 protected:
  /// The keys of one class of the family, with their defaults.
  struct Keys {
    const char* prefix;
    std::uint16_t pmbar;   // base port of the power management block
    std::uint16_t hwmbar;  // index port of the hardware monitor, where its device has no base
    std::uint16_t cfgbar;  // index port of the configuration registers
  };

  /// Eight GPIO lines: their logical device and its registers. A register of 0 is none.
  struct GpioGroup {
    std::uint8_t device;
    std::uint8_t enableBit;  // of the device's activation register
    std::uint8_t io;         // a set bit makes its line an input
    std::uint8_t data;
    std::uint8_t inversion;
    std::uint8_t status;
  };
  using GpioGroups = std::array<GpioGroup, 9>;

  /// A tachometer: its count, and where the three bits of its divisor's exponent stand.
  struct Counter {
    std::uint8_t count;
    std::uint8_t low;  // register with bits 0 and 1
    unsigned lowShift;
    std::uint8_t high;  // register with bit 2
    unsigned highBit;
  };

  /// A temperature in degrees; the register with its fraction, where there is one.
  struct Sensor {
    RegisterId degrees;
    std::optional<RegisterId> fraction = {};
  };

  /// For a derived class, which then reads its own keys and sets its tables. The keys of this class are read first.
  explicit WinChip(std::string chipName);

  /// Also moves the registers to the bases.
  void ReadKeys(const Keys& keys);

  /// The groups that the files describe; the given ones where they do not.
  void ReadGroups(const GpioGroups& defaults);

  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return config; }

  std::uint16_t pmbar = 0;
  std::vector<Counter> counters;
  std::vector<Sensor> sensors;
  RegisterId buttonOption{};  // kept with the power button's own register

 private:
  int ReadGroup(int line, std::uint8_t GpioGroup::*reg);

  ConfigRegisters registers;
  EachAccess config;
  WinMonitor monitor;
  GpioGroups groups{};
  SavedRegisters savedButton;
};

}  // namespace panelglow
