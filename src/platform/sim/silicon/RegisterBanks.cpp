#include "platform/sim/silicon/RegisterBanks.h"

#include <algorithm>
#include <cstdio>

namespace panelglow::platform::sim {

bool RegisterBanks::Has(std::uint8_t address) const {
  return address == setup_.select || std::any_of(setup_.banks.begin(), setup_.banks.end(),
                                                 [&](const auto& bank) { return bank.second.count(address) != 0; });
}

std::uint8_t RegisterBanks::Read(std::uint8_t address) const {
  return address == setup_.select ? selected_ : At(Selected(), address);
}

std::uint8_t RegisterBanks::At(std::uint8_t bank, std::uint8_t address) const {
  const auto registers = setup_.banks.find(bank);
  if (registers == setup_.banks.end()) {
    return 0xFF;
  }
  const auto found = registers->second.find(address);
  return found == registers->second.end() ? std::uint8_t{0xFF} : found->second;
}

void RegisterBanks::Write(std::uint8_t address, std::uint8_t value) {
  if (address == setup_.select) {
    selected_ = value;
  } else if (const auto registers = setup_.banks.find(Selected()); registers != setup_.banks.end()) {
    if (const auto found = registers->second.find(address); found != registers->second.end()) {
      found->second = value;
    }
  }
}

std::string RegisterBanks::State(const std::string& name) const {
  std::string text;
  for (const auto& [bank, registers] : setup_.banks) {
    text += RegisterRow(name + " bank " + std::to_string(bank), registers);
  }
  return text;
}

std::string RegisterRow(const std::string& name, const std::map<std::uint8_t, std::uint8_t>& registers) {
  std::string text = name + " registers";
  for (const auto& [address, value] : registers) {
    char part[16];
    std::snprintf(part, sizeof part, " %02X=%02X", address, value);
    text += part;
  }
  return text + "\n";
}

}  // namespace panelglow::platform::sim
