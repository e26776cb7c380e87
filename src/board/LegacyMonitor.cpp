#include "board/LegacyMonitor.h"

#include <utility>

#include "board/parts/Bits.h"
#include "board/parts/RpmOf.h"

namespace panelglow {

namespace {

constexpr int kLastRegister = 0xFF;
constexpr int kMostReads = 4;  // of a byte that moves on

}  // namespace

LegacyMonitor::LegacyMonitor(CDevio& client, std::uint16_t indexPort, std::uint16_t dataPort, Traits fixed)
    : RegisterChip("monitor"),
      registers(IndexedPorts(client, indexPort, dataPort)),
      isKnown(indexPort != 0 && dataPort != 0),
      traits(std::move(fixed)) {
  fans = traits.fans;
}

std::uint8_t LegacyMonitor::Read(int reg) { return registers.Read({0, static_cast<std::uint8_t>(reg)}); }

std::uint32_t LegacyMonitor::ReadFanTach(int fan, int /*arg*/) {
  if (!isKnown || fan < 0 || fan >= kLastRegister) {
    return kTachStopped;
  }
  std::uint8_t first = Read(fan);
  std::uint8_t second = Read(fan + 1);
  for (int reads = 1; !traits.isLatched && reads < kMostReads; ++reads) {
    const std::uint8_t again = Read(fan);
    if (again == first) {
      break;
    }
    first = again;
    second = Read(fan + 1);
  }
  const std::uint32_t raw = traits.isLatched ? WordOf(second, first) : WordOf(first, second);
  return raw >= traits.fans.tachOverflow ? kTachStopped : raw;
}

int LegacyMonitor::TachToRpm(std::uint32_t raw, int /*multiplier*/) { return RpmOf(traits.tachClock, raw); }

bool LegacyMonitor::ReadTemperature(int zone, int& value) {
  if (!isKnown || zone < 0 || zone > kLastRegister) {
    return false;
  }
  value = Read(zone);
  return true;
}

}  // namespace panelglow
