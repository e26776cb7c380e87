#include "platform/sim/silicon/LedPins.h"

#include <algorithm>

#include "platform/sim/silicon/SuperIo.h"

namespace panelglow::platform::sim {

namespace {

bool HasPin(const SuperIoLed& led, const LedFieldReader& value) {
  return std::all_of(led.needs.begin(), led.needs.end(), [&](const auto& need) { return Holds(need, value); });
}

std::optional<Microseconds> HalfPeriod(const SuperIoLed& led, const LedFieldReader& value) {
  const auto found = led.half_us.find(value(led.mode));
  return HasPin(led, value) && found != led.half_us.end() ? std::optional(found->second) : std::nullopt;
}

}  // namespace

bool Holds(const SuperIoCondition& condition, const LedFieldReader& value) {
  return value(condition.field) == condition.value;
}

bool LedLevel(const SuperIoLed& led, const LedFieldReader& value, Microseconds now) {
  if (!HasPin(led, value)) {
    return led.otherwise;
  }
  const std::optional<Microseconds> half = HalfPeriod(led, value);
  return half ? BlinkLevel(now, *half) : led.high.count(value(led.mode)) != 0;
}

std::optional<Microseconds> NextLedEdge(const std::vector<SuperIoLed>& leds, const LedFieldReader& value,
                                        Microseconds now) {
  std::optional<Microseconds> next;
  for (const SuperIoLed& led : leds) {
    if (const std::optional<Microseconds> half = HalfPeriod(led, value)) {
      const Microseconds edge = NextBlinkEdge(now, *half);
      next = std::min(next.value_or(edge), edge);
    }
  }
  return next;
}

}  // namespace panelglow::platform::sim
