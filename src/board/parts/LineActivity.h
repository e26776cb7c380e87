// What a line does over half a second: for lines that carry a signal rather than a level.
#pragma once

#include <functional>

namespace panelglow {

/// Reads the line as fast as it can for 500 ms. Minus the number of transitions when the line oscillates, else 1 when
/// it was high more often than low, or 0.
int MeasureLineActivity(const std::function<bool()>& isHigh);

}  // namespace panelglow
