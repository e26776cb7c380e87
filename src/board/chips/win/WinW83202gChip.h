// A Winbond Super-I/O of which one fan is used. Serves the chip name "win_w83202g".
#pragma once

#include "board/chips/win/WinChip.h"

namespace panelglow {

class WinW83202gChip : public WinChip {
 public:
  WinW83202gChip();
};

}  // namespace panelglow
