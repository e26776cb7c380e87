// Byte registers of which one selects what the others are: banks of a hardware monitor, pins of a GPIO device.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <utility>

namespace panelglow::platform::sim {

struct BankSetup {
  std::uint8_t select = 0;  // the register that selects
  std::uint8_t mask = 0xFF;
  std::map<std::uint8_t, std::map<std::uint8_t, std::uint8_t>> banks;  // by number, then by address
};

class RegisterBanks {
 public:
  explicit RegisterBanks(BankSetup setup) : setup_(std::move(setup)) {}

  /// Whether the address is the select register, or one that some bank has.
  [[nodiscard]] bool Has(std::uint8_t address) const;

  /// A bank that the part does not have, or has not at this address, reads as 0xFF and takes nothing.
  [[nodiscard]] std::uint8_t Read(std::uint8_t address) const;
  void Write(std::uint8_t address, std::uint8_t value);

  /// A register whatever bank is selected.
  [[nodiscard]] std::uint8_t At(std::uint8_t bank, std::uint8_t address) const;

  /// The registers of all banks, but not which is selected: every user selects before use.
  [[nodiscard]] std::string State(const std::string& name) const;

 private:
  [[nodiscard]] std::uint8_t Selected() const { return static_cast<std::uint8_t>(selected_ & setup_.mask); }

  BankSetup setup_;
  std::uint8_t selected_ = 0;
};

/// A row of text with the registers of a map.
std::string RegisterRow(const std::string& name, const std::map<std::uint8_t, std::uint8_t>& registers);

}  // namespace panelglow::platform::sim
