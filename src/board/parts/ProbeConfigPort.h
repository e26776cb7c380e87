// Where a Super-I/O answers.
#pragma once

#include <cstdint>
#include <span>

#include "hw/CDevio.h"

namespace panelglow {

/// The index port of the configuration registers: 0x2E, or 0x4E when nobody answers there to the keys that open them.
/// The part at 0x2E, if any, is left open: one that was opened by mistake closes with its own next operation.
inline std::uint16_t ProbeConfigPort(CDevio& devio, std::span<const std::uint8_t> keys) {
  constexpr std::uint16_t kFirst = 0x2E;
  constexpr std::uint16_t kSecond = 0x4E;
  constexpr std::uint8_t kNobody = 0xFF;
  for (const std::uint8_t key : keys) {
    devio.OutportByte(kFirst, key);
  }
  return devio.InportByte(kFirst + 1) == kNobody ? kSecond : kFirst;
}

}  // namespace panelglow
