// Where a Super-I/O answers.
#pragma once

#include <cstdint>
#include <vector>

#include "board/parts/ConfigMode.h"
#include "board/parts/ConfigRegisters.h"
#include "hw/CDevio.h"

namespace panelglow {

/// The index port of the configuration registers: 0x2E, or 0x4E when nobody answers there to the keys that open them.
/// The part at 0x2E, if any, is closed by the exit keys, also when it is not the one that was looked for; without
/// exit keys it is left open.
inline std::uint16_t ProbeConfigPort(CDevio& devio, const std::vector<std::uint8_t>& enterKeys,
                                     const std::vector<std::uint8_t>& exitKeys) {
  constexpr std::uint16_t kFirst = 0x2E;
  constexpr std::uint16_t kSecond = 0x4E;
  constexpr std::uint8_t kNobody = 0xFF;
  ConfigRegisters first(IndexedPorts(devio, kFirst), enterKeys, exitKeys);
  const ConfigMode mode(first);
  return devio.InportByte(kFirst + 1) == kNobody ? kSecond : kFirst;
}

}  // namespace panelglow
