// An SMBus host controller at an I/O base: one byte of a device per transaction.
#pragma once

#include <cstdint>
#include <optional>

#include "hw/CDevio.h"

namespace panelglow {

/// Every wait is bounded: a transaction takes 100 ms at most.
class SmbusHost {
 public:
  SmbusHost(CDevio& client, std::uint16_t basePort) : devio(&client), base(basePort) {}

  /// The byte behind a command of the device at `address`; nothing when the transaction does not end well.
  [[nodiscard]] std::optional<std::uint8_t> ReadByte(std::uint8_t address, std::uint8_t command) const;
  [[nodiscard]] bool WriteByte(std::uint8_t address, std::uint8_t command, std::uint8_t value) const;

 private:
  void Out(std::uint16_t offset, std::uint8_t value) const;
  std::uint8_t In(std::uint16_t offset) const;
  [[nodiscard]] std::uint8_t AwaitEnd() const;

  CDevio* devio;
  std::uint16_t base;
};

}  // namespace panelglow
