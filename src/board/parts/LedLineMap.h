// How the LED pin map registers of the ITE line name a GPIO line.
#pragma once

#include <cstdint>

namespace panelglow {

/// The map of a line that no LED can stand on.
constexpr std::uint8_t kNoLedLineMap = 255;

/// Eight lines in each group of ten, five groups from 10 on; the map leaves no gaps.
constexpr std::uint8_t LedLineMap(int line) {
  return line < 10 || line > 57 || line % 10 > 7 ? kNoLedLineMap : static_cast<std::uint8_t>(line - 2 * (line / 10));
}

}  // namespace panelglow
