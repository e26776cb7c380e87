// Registers of 1, 2 or 4 bytes in the physical address space, low byte first.
#pragma once

#include <cstdint>
#include <optional>

#include "hw/CDevio.h"

namespace panelglow {

class PhysicalRegisters {
 public:
  /// Offsets count from `baseAddress`.
  explicit PhysicalRegisters(CDevio& client, std::uint32_t baseAddress = 0) : devio(&client), base(baseAddress) {}

  /// Nothing when the driver cannot read there.
  [[nodiscard]] std::optional<std::uint32_t> Read(std::uint32_t offset, std::uint32_t bytes) const;
  [[nodiscard]] std::optional<std::uint8_t> ReadByte(std::uint32_t offset) const;

  /// False when the driver cannot write there.
  bool Write(std::uint32_t offset, std::uint32_t bytes, std::uint32_t value) const;
  bool WriteByte(std::uint32_t offset, std::uint8_t value) const { return Write(offset, 1, value); }

 private:
  CDevio* devio;
  std::uint32_t base;
};

}  // namespace panelglow
