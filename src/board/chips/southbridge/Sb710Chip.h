// The next southbridge of the line: other GPIO lines in other registers, all else as its elder. Serves the chip name
// "sb710".
#pragma once

#include <array>

#include "board/chips/southbridge/SbxChip.h"

namespace panelglow {

class Sb710Chip : public SbxChip {
 public:
  Sb710Chip() : SbxChip("sb710", "chip.Sb710.", kLines) {}

 private:
  static constexpr std::array<LineRange, 2> kLines{{{45, 48, 0xA6, 24}, {53, 56, 0x52, 24}}};
};

}  // namespace panelglow
