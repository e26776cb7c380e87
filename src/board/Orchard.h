// The board class "Orchard": the power LED hangs on GPIO lines of an SMSC Super-I/O, behind a port of their own.
#pragma once

#include <cstdint>

#include "board/OldestBoard.h"
#include "board/parts/PowerButton.h"

namespace panelglow {

class Orchard : public OldestBoard {
 public:
  explicit Orchard(std::uint16_t boardId);

  /// Makes the LED's pins GPIO lines.
  bool SavePowerLedState() override;
  bool AssertPowerLedGreen() override;
  bool AssertPowerLedRed() override;
  bool DeassertPowerLed() override;

  /// The LED is green again, its pins as they are after a start; true, and nothing is done, without a save.
  bool RestorePowerLedState() override;

  /// The cable of a network controller is found by driving that controller's pin.
  bool DetectLegacyDevice(LegacyDevice device, bool& present) override;

  bool SavePowerButton() override;
  bool RestorePowerButton() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;

 private:
  bool DetectNicDashCable(int line, bool& present);
  bool Light(std::uint8_t lines);

  PowerButton button;
  bool isSaved = false;
};

}  // namespace panelglow
