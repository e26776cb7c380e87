// LED pins with modes, whatever space their registers stand in.
#pragma once

#include <functional>
#include <optional>
#include <vector>

#include "platform/sim/silicon/SuperIoTables.h"

namespace panelglow::platform::sim {

/// The masked value of a field.
using LedFieldReader = std::function<std::uint8_t(const SuperIoField&)>;

bool Holds(const SuperIoCondition& condition, const LedFieldReader& value);

bool LedLevel(const SuperIoLed& led, const LedFieldReader& value, Microseconds now);

/// When the first of those that blink changes next.
std::optional<Microseconds> NextLedEdge(const std::vector<SuperIoLed>& leds, const LedFieldReader& value,
                                        Microseconds now);

}  // namespace panelglow::platform::sim
