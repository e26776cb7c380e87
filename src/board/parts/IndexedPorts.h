// Registers behind an index port and a data port.
#pragma once

#include <cstdint>
#include <span>

#include "hw/CDevio.h"

namespace panelglow {

/// A value: copies reach the same ports. The driver client must outlive it.
class IndexedPorts {
 public:
  IndexedPorts(CDevio& client, std::uint16_t indexPort, std::uint16_t dataPort)
      : devio(&client), index(indexPort), data(dataPort) {}

  /// The data port stands behind the index port.
  IndexedPorts(CDevio& client, std::uint16_t indexPort)
      : IndexedPorts(client, indexPort, static_cast<std::uint16_t>(indexPort + 1)) {}

  [[nodiscard]] std::uint8_t Read(std::uint8_t reg) const {
    devio->OutportByte(index, reg);
    return devio->InportByte(data);
  }

  void Write(std::uint8_t reg, std::uint8_t value) const {
    devio->OutportByte(index, reg);
    devio->OutportByte(data, value);
  }

  /// The index stands still between the read and the write.
  void SetBits(std::uint8_t reg, std::uint8_t bits) const { devio->OutportByte(data, Read(reg) | bits); }

  /// Bytes for the index port alone, as the keys of a configuration mode.
  void Send(std::span<const std::uint8_t> keys) const {
    for (const std::uint8_t key : keys) {
      devio->OutportByte(index, key);
    }
  }

  [[nodiscard]] std::uint16_t IndexPort() const { return index; }

 private:
  CDevio* devio;
  std::uint16_t index;
  std::uint16_t data;
};

}  // namespace panelglow
