// A block of byte registers in the physical address space, as a chipset's memory-mapped GPIO.
#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include "platform/sim/silicon/Device.h"

namespace panelglow::platform::sim {

class MemoryRegisters : public Device {
 public:
  MemoryRegisters(std::uint64_t base, std::vector<std::uint8_t> bytes) : base_(base), bytes_(std::move(bytes)) {}

  [[nodiscard]] std::vector<AddressRange> MemoryRanges() const override { return {{base_, bytes_.size()}}; }
  std::uint8_t ReadMemory(std::uint64_t address) override {
    return bytes_[static_cast<std::size_t>(address - base_)];
  }
  void WriteMemory(std::uint64_t address, std::uint8_t value) override {
    bytes_[static_cast<std::size_t>(address - base_)] = value;
  }

  /// Pins "<offset>.<bit>", the offset in hexadecimal.
  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::optional<std::pair<std::size_t, unsigned>> Locate(std::string_view pin) const;

  std::uint64_t base_;
  std::vector<std::uint8_t> bytes_;
};

}  // namespace panelglow::platform::sim
