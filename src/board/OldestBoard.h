// What the three oldest board classes share: a driver client of their own, and LED and button code in the board
// itself, with ports from the flat keys of the detection file.
#pragma once

#include <cstdint>
#include <string>

#include "board/MotherBoard.h"
#include "board/parts/IndexedPorts.h"
#include "hw/CDevio.h"

namespace panelglow {

class OldestBoard : public MotherBoard {
 public:
  bool IsPowerLedRedSupported(bool& supported) override;

 protected:
  /// What is fixed for a class. The data port stands behind the index port.
  struct Traits {
    std::uint16_t indexPort;  // of the Super-I/O
    bool fanLatched;          // ... whose fans' counters are latched; also: the power LED has a red part
  };

  OldestBoard(std::string boardClass, std::uint16_t boardId, const Traits& fixed);

  /// A number of the flat keys, decimal or hexadecimal behind "0x"; 0 when there is none.
  [[nodiscard]] static std::uint16_t ReadFlatWord(const char* key);

  CDevio devio;
  Traits traits;
  IndexedPorts superIo;
};

}  // namespace panelglow
