// Bits that files name by their number as text.
#pragma once

#include <string>

#include "board/parts/Bits.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

/// The mask of a bit of a word of `width` bits; 0 for a bit that the word does not have.
inline std::uint32_t MaskOfBitName(const std::string& bitName, unsigned width) {
  return MaskOfBit(CDMUtil::ToInt(bitName), width);
}

}  // namespace panelglow
