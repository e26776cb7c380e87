// The board class "sb7sch5": an SMSC Super-I/O behind an SB7xx southbridge.
#pragma once

#include <string>

#include "board/MotherBoard.h"
#include "hw/Tsk.h"

namespace panelglow {

class Sb7Sch5 : public MotherBoard {
 public:
  /// `systemIdText` is the system id as hexadecimal text.
  explicit Sb7Sch5(const std::string& systemIdText) : MotherBoard("SB7sch5", SystemIdOf(systemIdText)) {
    Place("sio");
    Place("sbx");
    powerLed.name = "sio";
  }
};

}  // namespace panelglow
