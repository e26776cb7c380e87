// The board class "Lantern": the power LED hangs on a multi-function pin of the Super-I/O, and is lit by the chip
// that the files name. The class places no chip itself, so that on its own it tells people that the LED cannot be
// lit.
#pragma once

#include <cstdint>
#include <optional>

#include "board/OldestBoard.h"
#include "board/parts/PowerEventButton.h"

namespace panelglow {

class Lantern : public OldestBoard {
 public:
  explicit Lantern(std::uint16_t boardId) : Lantern("Lantern", boardId, kIndexPort) {}

  /// Opens the Super-I/O's configuration mode, which stays open for the blinking, and gives the pin to the LED.
  bool SavePowerLedState() override;

  /// Puts the pin back and closes the mode; true, and nothing is done, without a save.
  bool RestorePowerLedState() override;

  // The button is where the first settings have it; false, and nothing is touched, when they have it nowhere.
  bool SavePowerButton() override;
  bool RestorePowerButton() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;

 protected:
  static constexpr std::uint8_t kPinRegister = 0x2A;  // multi-function pins

  Lantern(std::string boardClass, std::uint16_t boardId, std::uint16_t indexPort);

  /// The first half of a save: the mode is open, the register is kept.
  std::uint8_t OpenAndKeep();

 private:
  static constexpr std::uint16_t kIndexPort = 0x2E;

  PowerEventButton button;
  bool isOpen = false;
  std::optional<std::uint8_t> savedPins;
};

}  // namespace panelglow
