// The lock of a computer's hood, as bits of a configuration register that start its motor.
#pragma once

#include <cstdint>

#include "board/parts/RegisterFile.h"

namespace panelglow {

enum class HoodCommand : std::uint8_t { kLock = 0x40, kUnlock = 0x80 };

/// True when the part has done it, which takes two seconds at most: it clears the bit then.
bool MoveHoodLock(RegisterFile& config, HoodCommand command);

}  // namespace panelglow
