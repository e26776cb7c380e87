// Base address registers of a Super-I/O's logical devices.
#pragma once

#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/RegisterFile.h"

namespace panelglow {

/// False for what a base reads as where there is none: not set, or nobody answers. Nothing is to be touched there.
constexpr bool IsBase(std::uint16_t base) { return base != 0 && base != 0xFFFF; }

/// The 16-bit base of a logical device, the high byte's register first; see IsBase.
inline std::uint16_t ReadBase(RegisterFile& config, std::uint8_t device, std::uint8_t highReg = 0x60,
                              std::uint8_t lowReg = 0x61) {
  const ConfigMode mode(config);
  const std::uint8_t high = config.Read({device, highReg});
  return WordOf(high, config.Read({device, lowReg}));
}

}  // namespace panelglow
