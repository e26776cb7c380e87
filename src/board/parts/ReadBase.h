// Base address registers of a Super-I/O's logical devices.
#pragma once

#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/RegisterFile.h"

namespace panelglow {

/// The 16-bit base of a logical device, the high byte's register first.
inline std::uint16_t ReadBase(RegisterFile& config, std::uint8_t device, std::uint8_t highReg = 0x60,
                              std::uint8_t lowReg = 0x61) {
  const ConfigMode mode(config);
  const std::uint8_t high = config.Read({device, highReg});
  return WordOf(high, config.Read({device, lowReg}));
}

}  // namespace panelglow
