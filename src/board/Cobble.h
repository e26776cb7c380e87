// The board class "cobble": a sensor chip and an SMSC Super-I/O behind an ICH southbridge.
#pragma once

#include <string>

#include "board/MotherBoard.h"
#include "hw/Tsk.h"

namespace panelglow {

class Cobble : public MotherBoard {
 public:
  /// `systemIdText` is the system id as hexadecimal text.
  explicit Cobble(const std::string& systemIdText) : MotherBoard("Cobble", SystemIdOf(systemIdText)) {
    Place("adt");
    Place("acpi");
    Place("ich");
    Place("sio");
  }
};

}  // namespace panelglow
