// A value that a register has for a moment only.
#pragma once

#include <cstdint>

#include "board/parts/ConfigMode.h"
#include "platform/Host.h"

namespace panelglow {

inline constexpr std::uint32_t kPulse_ms = 10;

/// Writes `high` with `write`, and `low` 10 ms later, or as soon as the thread is told to end.
template <class Write>
void SendPulse(const Write& write, std::uint8_t high, std::uint8_t low) {
  struct Level {
    const Write& to;
    std::uint8_t entered;
    std::uint8_t left;
    void EnterConfigMode() const { to(entered); }
    void ExitConfigMode() const { to(left); }
  };
  const Level level{write, high, low};
  const ConfigMode<const Level> pulse(level);
  platform::TheHost().clock.Sleep(kPulse_ms);
}

}  // namespace panelglow
