// Bits that stay set until they are written: what they show now, without what they remember.
#pragma once

#include <cstdint>

#include "board/parts/RegisterFile.h"

namespace panelglow {

/// Clears the latched bit of a register by writing it, and reads again after `settle_ms`: true when it is set anew.
bool ReadClearedLatch(RegisterFile& file, RegisterId id, std::uint8_t bit, std::uint32_t settle_ms);

}  // namespace panelglow
