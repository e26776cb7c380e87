// The loop that all blink workers share.
#pragma once

#include <cstdint>
#include <functional>

namespace panelglow {

struct LEDStruct;

inline constexpr std::uint32_t kPhase_ms = 500;  // of most LEDs, on as well as off

/// Switches on, waits a phase, switches off, waits a phase: at most 50 times, and only while the entry's `running` is
/// set, which is looked at once a cycle. A worker that is told to end in an on phase still switches off.
void BlinkLoop(const LEDStruct& entry, std::uint32_t phase_ms, const std::function<void()>& switchOn,
               const std::function<void()>& switchOff);

/// The same with phases of two lengths.
void BlinkLoop(const LEDStruct& entry, std::uint32_t on_ms, std::uint32_t off_ms,
               const std::function<void()>& switchOn, const std::function<void()>& switchOff);

}  // namespace panelglow
