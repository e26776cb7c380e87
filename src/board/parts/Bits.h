// Bits whose numbers come from files and tables, and words put together from registers.
#pragma once

#include <cstdint>

namespace panelglow {

constexpr std::uint8_t LowByte(std::uint32_t value) { return static_cast<std::uint8_t>(value); }
constexpr std::uint8_t HighByte(std::uint32_t value) { return static_cast<std::uint8_t>(value >> 8U); }
constexpr std::uint16_t WordOf(std::uint8_t high, std::uint8_t low) {
  return static_cast<std::uint16_t>(high << 8U | low);
}

/// The mask of a bit of a word of `width` bits (at most 32); 0 for a bit that the word does not have.
constexpr std::uint32_t MaskOfBit(int bit, unsigned width) {
  return bit >= 0 && static_cast<unsigned>(bit) < width ? 1U << static_cast<unsigned>(bit) : 0;
}

}  // namespace panelglow
