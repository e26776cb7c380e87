// A Super-I/O of the ITE line with its registers in code: fans and zones of its hardware monitor, and an LED that is
// a GPIO line with a blink function. Serves the chip name "ite"; the base of its family.
#pragma once

#include <cstdint>
#include <string>

#include "board/chips/RegisterChip.h"
#include "board/chips/ite/IteConfigRegisters.h"
#include "board/parts/IndexedRegisters.h"

namespace panelglow {

class IteChip : public RegisterChip {
 public:
  IteChip() : IteChip("ite") {}

  int TachToRpm(std::uint32_t raw, int multiplier) override;
  int MapTemperature(int raw) override;
  int ReadLine(int /*line*/) override { return kNoSuchLine; }

 protected:
  /// For a derived class, which then reads its own keys and sets its tables. The keys of this class are read first.
  explicit IteChip(std::string chipName);

  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return config; }

  /// Two duties of the 255 are one of this part's 127.
  [[nodiscard]] std::uint8_t DutyOf(int value) const override;

  /// "hwmbar" with the beginning of the class's keys: the base of the hardware monitor.
  void ReadMonitorBase(const std::string& prefix);

  // Configuration registers of the device that has the GPIO lines and the LEDs; the global ones are reached with it
  // selected.
  static constexpr std::uint8_t kLedDevice = 7;
  static constexpr RegisterId kLed1Map{kLedDevice, 0xF8};
  static constexpr RegisterId kLed1Control{kLedDevice, 0xF9};
  static constexpr RegisterId kLed2Map{kLedDevice, 0xFA};
  static constexpr RegisterId kLed2Control{kLedDevice, 0xFB};
  static constexpr RegisterId kGpioSet2{kLedDevice, 0x26};  // global: pins that are lines
  static constexpr std::uint8_t kLedPins = 0x0C;            // of it
  static constexpr std::uint8_t kOneHertz = 0x02;           // of an LED's control

  std::uint8_t primary = 0;  // maps of the lines of the LED's two colours
  std::uint8_t secondary = 0;
  IndexedRegisters monitor;
  IteConfigRegisters config;
};

}  // namespace panelglow
