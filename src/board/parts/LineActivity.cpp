#include "board/parts/LineActivity.h"

#include <cstdint>

#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kWatch_ms = 500;
// More than can be read in that time; ends the watch where reading takes no time at all.
constexpr int kMostSamples = 1'000'000;
constexpr int kFewTransitions = 4;

// Between a quarter below and a quarter above half of all samples.
bool IsNearHalf(int count, int half) {
  const int low = static_cast<int>(half - 0.25 * half);
  const int high = static_cast<int>(1.25 * half);
  return count > low && count < high;
}

}  // namespace

int MeasureLineActivity(const std::function<bool()>& isHigh) {
  platform::Clock& clock = platform::TheHost().clock;
  const std::uint32_t start = clock.TickCount();
  int high = 0;
  int low = 0;
  int transitions = 0;
  bool last = false;  // so the first sample counts as a transition when it is high
  while (clock.TickCount() - start < kWatch_ms && high + low < kMostSamples) {
    const bool now = isHigh();
    ++(now ? high : low);
    transitions += now != last ? 1 : 0;
    last = now;
  }
  const int half = (high + low) / 2;
  if (transitions > kFewTransitions && IsNearHalf(high, half) && IsNearHalf(low, half)) {
    return -transitions;
  }
  return high > low ? 1 : 0;
}

}  // namespace panelglow
