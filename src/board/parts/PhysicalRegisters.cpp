#include "board/parts/PhysicalRegisters.h"

#include <array>
#include <cstddef>

namespace panelglow {

namespace {

using Word = std::array<std::byte, 4>;

}  // namespace

std::optional<std::uint32_t> PhysicalRegisters::Read(std::uint32_t offset, std::uint32_t bytes) const {
  Word word{};
  if (devio->ReadPhysicalMemory(base + offset, bytes, word) == 0) {
    return std::nullopt;
  }
  std::uint32_t value = 0;
  for (std::size_t i = word.size(); i-- > 0;) {
    value = value << 8U | std::to_integer<std::uint32_t>(word[i]);
  }
  return value;
}

std::optional<std::uint8_t> PhysicalRegisters::ReadByte(std::uint32_t offset) const {
  const std::optional<std::uint32_t> value = Read(offset, 1);
  return value ? std::optional(static_cast<std::uint8_t>(*value)) : std::nullopt;
}

bool PhysicalRegisters::Write(std::uint32_t offset, std::uint32_t bytes, std::uint32_t value) const {
  Word word{};
  for (std::size_t i = 0; i < word.size(); ++i) {
    word[i] = static_cast<std::byte>(value >> (8 * i));
  }
  return devio->WritePhysicalMemory(base + offset, bytes, word) != 0;
}

}  // namespace panelglow
