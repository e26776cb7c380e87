// The board class "ich_win": a Winbond Super-I/O behind an ICH southbridge.
#pragma once

#include <string>

#include "board/MotherBoard.h"
#include "hw/Tsk.h"

namespace panelglow {

class IchWin : public MotherBoard {
 public:
  /// `systemIdText` is the system id as hexadecimal text.
  explicit IchWin(const std::string& systemIdText) : MotherBoard("Ich_win", SystemIdOf(systemIdText)) {
    Place("win_wpcd376");
    Place("ich");
    powerLed.name = "win_wpcd376";
  }
};

}  // namespace panelglow
