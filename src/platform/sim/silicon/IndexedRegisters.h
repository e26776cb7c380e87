// Byte registers behind an index and a data port, and no more: a hardware monitor that stands for itself.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>

#include "platform/sim/silicon/CoolingModel.h"
#include "platform/sim/silicon/Device.h"
#include "platform/sim/silicon/RegisterBanks.h"

namespace panelglow::platform::sim {

struct IndexedRegistersSetup {
  std::uint16_t indexPort = 0;  // the data port is the next one
  std::map<std::uint8_t, std::uint8_t> registers;
  std::optional<BankSetup> banks;
  std::set<std::uint8_t> readOnly;  // readings, in every bank: what is written is lost
  CoolingSetup cooling;             // fans and temperatures that move; their readings are no registers of the above
};

/// A register that the part does not have reads as 0xFF and takes nothing. Pins: "<register>.<bit>", or
/// "<bank>:<register>.<bit>" of a banked one, in hexadecimal.
class IndexedRegisters : public Device {
 public:
  IndexedRegisters(const IndexedRegistersSetup& setup, const Scheduler& time);

  [[nodiscard]] std::vector<AddressRange> PortRanges() const override { return {{setup_.indexPort, 2}}; }
  std::uint8_t ReadPort(std::uint16_t port) override;
  void WritePort(std::uint16_t port, std::uint8_t value) override;

  [[nodiscard]] std::optional<bool> Signal(std::string_view pin) const override;
  [[nodiscard]] std::optional<std::uint64_t> RegisterOf(std::string_view pin) const override;
  [[nodiscard]] std::string State() const override;

 private:
  [[nodiscard]] std::uint8_t Register(std::uint8_t address) const;

  IndexedRegistersSetup setup_;
  const Scheduler& time_;
  std::optional<RegisterBanks> banks_;
  CoolingModel cooling_;
  std::uint8_t index_ = 0;
};

}  // namespace panelglow::platform::sim
