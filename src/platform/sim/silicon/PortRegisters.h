// Byte registers in I/O ports, as a southbridge's GPIO and power-management blocks.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

/// 32 GPIO lines: one bit each in registers of four bytes.
struct PortLines {
  std::uint16_t level = 0;                 // offsets, as the following
  std::optional<std::uint16_t> select;     // bit clear: the line serves another function
  std::optional<std::uint16_t> direction;  // bit set: an input
  std::uint32_t outside = 0;               // levels of lines that are no outputs
};

struct PortRegistersSetup {
  std::uint16_t base = 0;
  std::map<std::uint16_t, std::uint8_t> registers;   // by offset
  std::map<std::uint16_t, std::uint8_t> clearByOne;  // masks: bits of events, which a written 1 clears and 0 leaves
  std::map<std::uint16_t, std::uint8_t> readOnly;    // masks
  std::vector<PortLines> lines;
};

/// Only the ports of registers that are told answer. A level register drives the lines that are outputs and reads the
/// pins of the others, whose bits take nothing.
class PortRegisters : public Device {
 public:
  explicit PortRegisters(PortRegistersSetup setup) : setup_(std::move(setup)) {}

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override;
  std::uint8_t ReadPort(std::uint16_t port) override { return Read(static_cast<std::uint16_t>(port - setup_.base)); }
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  /// Pins "<offset>.<bit>" as the register reads, the offset in hexadecimal.
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::uint8_t Latch(std::uint16_t offset) const;
  [[nodiscard]] const PortLines* LinesAt(std::uint16_t offset) const;  // of a level register
  [[nodiscard]] std::uint8_t Outputs(const PortLines& lines, unsigned byte) const;
  [[nodiscard]] std::uint8_t Read(std::uint16_t offset) const;

  PortRegistersSetup setup_;
};

}  // namespace panelglow::platform::sim
