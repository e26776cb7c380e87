#include "board/chips/win/WinMonitor.h"

#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/ReadBase.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kMonitorDevice = 0x0B;

// Its configuration registers.
constexpr RegisterId kActivate{kMonitorDevice, 0x30};
constexpr RegisterId kBaseHigh{kMonitorDevice, 0x60};
constexpr RegisterId kBaseLow{kMonitorDevice, 0x61};

constexpr std::uint16_t kIndexOffset = 5;  // from the base
constexpr std::uint8_t kBankSelect = 0x4E;

}  // namespace

IndexedPorts WinMonitor::SelectBank(std::uint8_t bank) {
  config.Write(kActivate, 1);
  const std::uint8_t high = config.Read(kBaseHigh);
  const std::uint16_t base = WordOf(high, config.Read(kBaseLow));
  const IndexedPorts ports(*devio, IsBase(base) ? static_cast<std::uint16_t>(base + kIndexOffset) : fallback);
  ports.Write(kBankSelect, bank);
  return ports;
}

std::uint8_t WinMonitor::Read(RegisterId id) {
  const ConfigMode mode(config);
  return SelectBank(id.place).Read(id.reg);
}

void WinMonitor::Write(RegisterId id, std::uint8_t value) {
  const ConfigMode mode(config);
  SelectBank(id.place).Write(id.reg, value);
}

}  // namespace panelglow
