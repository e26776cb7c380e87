#include "board/chips/ec/EcWpc8763Chip.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kTach1 = 0xB3;
constexpr std::uint8_t kTach2 = 0xB5;
constexpr std::uint32_t kNoTach = 255;
constexpr int kTachClock = 1'350'000;

}  // namespace

std::uint32_t EcWpc8763Chip::ReadFanTach(int fan, int /*arg*/) {
  if (fan == 1 || fan == 2) {
    return ReadEc(fan == 1 ? kTach1 : kTach2);
  }
  return kNoTach;
}

int EcWpc8763Chip::TachToRpm(std::uint32_t raw, int multiplier) {
  if (raw == 0 || raw == kNoTach || multiplier == 0) {
    return 0;
  }
  return kTachClock / static_cast<int>(raw) / multiplier;
}

}  // namespace panelglow
