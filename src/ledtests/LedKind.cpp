#include "ledtests/LedKind.h"

#include <algorithm>

namespace panelglow {

namespace {

// function key, device id, start command, button command, error code, name in log lines
constexpr LedKind kKinds[] = {
    {"noled", kNoLed, 2019, 1019, "770146", "BND"},
    {"numlock", kNumLock, 2003, 1003, "770102", "BNL"},
    {"chargegreen", kChargeGreen, 2052, 1012, "770148", "BCL"},
    {"scrolllock", kScrollLock, 2009, 1009, "770100", "BSL"},
    {"capslock", kCapsLock, 2006, 1006, "770101", "BCL"},
    {"hdred", kHdRed, 2016, 1016, "770132", "BRHD"},
    {"powerred", kPowerRed, 2020, 1020, "770134", "BRCP"},
    {"powergreen", kPowerGreen, 2017, 1017, "770133", "BGCP"},
    {"network", kNetwork, 2050, 1018, "770146", "BNL"},
    {"webcam", kWebcam, 2051, 1024, "770147", "BWL"},
    {"chargered", kChargeRed, 2053, 1015, "770149", "BNL"},
    {"touchpadlock", kTouchpad, 2054, 1025, "770146", "BTL"},
    {"speakermute", kSpeakerMute, 2055, 1026, "770146", "BSL"},
    {"microphone", kMicrophone, 2056, 1027, "770146", "BML"},
    {"hdgreen", kFirstHdGreen, kHdGreenCommand, kHdButtonCommand, "770106", "BCHD"},
};

template <class Predicate>
const LedKind* FindKind(Predicate matches) {
  const auto* found = std::find_if(std::begin(kKinds), std::end(kKinds), matches);
  return found == std::end(kKinds) ? nullptr : found;
}

}  // namespace

std::span<const LedKind> LedKinds() { return kKinds; }

const LedKind* FindLedKindByFunction(std::string_view function) {
  return FindKind([&](const LedKind& kind) { return kind.function == function; });
}

const LedKind* FindLedKindByStartCommand(std::uint32_t command) {
  return FindKind([&](const LedKind& kind) { return kind.startCommand == command; });
}

const LedKind* FindLedKindByButton(std::uint32_t command) {
  return FindKind([&](const LedKind& kind) { return kind.buttonCommand == command; });
}

}  // namespace panelglow
