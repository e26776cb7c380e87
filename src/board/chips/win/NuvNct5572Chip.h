// A Nuvoton Super-I/O with two fans whose speeds it works out by itself, and the power button in the chipset. Serves
// the chip name "nuv_nct5572".
#pragma once

#include <cstdint>

#include "board/chips/win/NuvW83667Chip.h"
#include "board/parts/PortRegisters.h"

namespace panelglow {

class NuvNct5572Chip : public NuvW83667Chip {
 public:
  NuvNct5572Chip();

  std::uint32_t ReadFanTach(int fan, int arg) override;

  /// The part gives revolutions per minute.
  int TachToRpm(std::uint32_t raw, int multiplier) override;

  bool SavePowerButtonState() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;
  bool RestorePowerButtonState() override;

 private:
  PortRegisters buttonPorts;
  SavedRegisters savedButtonPorts;
};

}  // namespace panelglow
