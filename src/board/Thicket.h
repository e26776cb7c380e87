// The board class "mistral": an ITE Super-I/O behind an ICH southbridge.
#pragma once

#include <string>

#include "board/MotherBoard.h"
#include "hw/Tsk.h"

namespace panelglow {

class Thicket : public MotherBoard {
 public:
  /// `systemIdText` is the system id as hexadecimal text.
  explicit Thicket(const std::string& systemIdText) : MotherBoard("Thicket", SystemIdOf(systemIdText)) {
    Place("ich");
    Place("ite");
    Place("acpi");
    powerLed.name = "ite";
    zones.PresetChip("ite");
  }
};

}  // namespace panelglow
