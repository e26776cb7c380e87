// Revolutions per minute from the count of a tachometer.
#pragma once

#include <cstdint>

namespace panelglow {

/// The count of a tachometer that has run over: the fan stands.
constexpr std::uint32_t kTachStopped = 0xFFFF;

/// `clock` is in counts per minute; 0 for a count of 0 or `stopped`.
constexpr int RpmOf(std::int64_t clock, std::uint32_t raw, std::uint32_t stopped = kTachStopped) {
  return raw == 0 || raw == stopped ? 0 : static_cast<int>(clock / std::int64_t{raw});
}

}  // namespace panelglow
