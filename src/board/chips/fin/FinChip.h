// A Super-I/O of the Fintek line with its registers in code: three fans and zones of its hardware monitor, GPIO lines
// and the LED pins in configuration registers, the power button in the chipset's power management block. Serves the
// chip name "fin"; the base of its family.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "board/chips/RegisterChip.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/EachAccess.h"
#include "board/parts/IndexedRegisters.h"
#include "board/parts/PowerEventButton.h"

namespace panelglow {

class FinChip : public RegisterChip {
 public:
  FinChip();

  int TachToRpm(std::uint32_t raw, int multiplier) override;
  int MapTemperature(int raw) override;

  /// `line` is an offset in the power management block.
  bool ReadIntrusionLatch(int line, bool clearFirst, bool& value) override;

  /// 237 is the case switch as the hardware monitor sees it, 238 as the chipset latches it.
  int ReadLine(int line) override;

  bool SavePowerButtonState() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;
  bool RestorePowerButtonState() override;

 protected:
  /// The keys of one class of the family, with their defaults.
  struct Keys {
    const char* prefix;
    std::uint16_t pmbar;   // base port of the power management block
    std::uint16_t hwmbar;  // index port of the hardware monitor
    std::uint16_t cfgbar;  // index port of the configuration registers
    std::uint8_t green;    // multi-function select 2: the LED's colours
    std::uint8_t red;
    std::optional<std::uint8_t> gpios15And16 = {};  // multi-function select 3: pins 15 and 16; not of all classes
  };

  /// For a derived class, which then reads its own keys and sets its tables. The keys of this class are read first.
  explicit FinChip(std::string chipName);

  /// Also moves the register files and the power button to the bases.
  void ReadKeys(const Keys& keys);

  /// The values of multi-function selects 2 and 3 by their short keys, where these are present.
  void ReadSelectKeys();

  /// The LED by multi-function select 2, with the values as they have been read.
  void SetSelectLed();

  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return ledRegisters; }

  std::uint16_t pmbar = 0;
  std::uint8_t green = 0;
  std::uint8_t red = 0;
  std::uint8_t gpios15And16 = 0;
  IndexedRegisters monitor;
  ConfigRegisters config;

 private:
  EachAccess ledRegisters;
  PowerEventButton button;
};

}  // namespace panelglow
