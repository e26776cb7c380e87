// The board class "cbb": four models of one line, each with the Super-I/O that its system id tells.
#pragma once

#include <string>

#include "board/MotherBoard.h"

namespace panelglow {

class Cbb : public MotherBoard {
 public:
  /// `systemIdText` is the system id as hexadecimal text. A model that is none of the four has no chip.
  explicit Cbb(const std::string& systemIdText);
};

}  // namespace panelglow
