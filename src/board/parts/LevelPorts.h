// GPIO lines whose levels are ports, eight lines each.
#pragma once

#include "board/parts/Bits.h"
#include "board/parts/Lines.h"
#include "hw/CDevio.h"

namespace panelglow {

/// The state of a line: 23 is bit 3 of the second port from `base` on. A number that names no bit, and one above 99,
/// is no line, and nothing is touched for it.
inline int ReadLevelLine(CDevio& devio, std::uint16_t base, int line) {
  if (line < 10 || line > 99 || line % 10 > 7) {
    return kNoSuchLineState;
  }
  const std::uint8_t levels = devio.InportByte(static_cast<std::uint16_t>(base + line / 10 - 1));
  return LineState((levels & MaskOfBit(line % 10, 8)) != 0);
}

}  // namespace panelglow
