// A Nuvoton Super-I/O with nine GPIO groups, whose fans follow temperatures from banks of their own. Serves the chip
// name "nuv_w83667".
#pragma once

#include <string>

#include "board/chips/win/WinChip.h"

namespace panelglow {

class NuvW83667Chip : public WinChip {
 public:
  NuvW83667Chip();

 protected:
  /// As WinChip's.
  explicit NuvW83667Chip(std::string chipName);
};

}  // namespace panelglow
