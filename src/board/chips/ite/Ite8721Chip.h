// A Super-I/O of the ITE line that blinks one or two LED lines by itself, has its GPIO levels in ports, and watches
// the hood. Serves the chip name "ite_8721".
#pragma once

#include <cstdint>

#include "board/chips/ite/Ite8758Chip.h"

namespace panelglow {

class Ite8721Chip : public Ite8758Chip {
 public:
  Ite8721Chip();

  /// Line 23 is bit 3 of the second port.
  int ReadLine(int line) override;

  /// The latch is always cleared first, and no line is asked for: there is one.
  bool ReadIntrusionLatch(int line, bool clearFirst, bool& value) override;

 private:
  std::uint16_t gpiobar;  // base of the level ports
};

}  // namespace panelglow
