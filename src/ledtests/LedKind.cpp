#include "ledtests/LedKind.h"

#include <algorithm>
#include <iterator>

namespace panelglow {

namespace {

void BlinkSpeaker(FrontPanelTest& test, LEDStruct& entry) { CustomBlinkSpeakerLed(test, entry); }
void BlinkMicrophone(FrontPanelTest& test, LEDStruct& entry) { CustomBlinkMicrophoneLed(test, entry); }

// function key, device id, start command, button command, error code, name in log lines, worker
constexpr LedKind kKinds[] = {
    {"noled", kNoLed, 2019, 1019, "770146", "BND", CustomBlinkNoLED},
    {"numlock", kNumLock, 2003, 1003, "770102", "BNL", CustomBlinkNumLockLED},
    {"chargegreen", kChargeGreen, 2052, 1012, "770148", "BCL", CustomBlinkChargeLED},
    {"scrolllock", kScrollLock, 2009, 1009, "770100", "BSL", CustomBlinkScrollLockLED},
    {"capslock", kCapsLock, 2006, 1006, "770101", "BCL", CustomBlinkCapsLockLED},
    {"hdred", kHdRed, 2016, 1016, "770132", "BRHD", CustomBlinkRedHDLED},
    {"powerred", kPowerRed, 2020, 1020, "770134", "BRCP", CustomBlinkRedPowerLED},
    {"powergreen", kPowerGreen, 2017, 1017, "770133", "BGCP", CustomBlinkGreenPowerLED},
    {"network", kNetwork, 2050, 1018, "770146", "BNL", CustomBlinkNetworkLED},
    {"webcam", kWebcam, 2051, 1024, "770147", "BWL", CustomBlinkWebcamLED},
    {"chargered", kChargeRed, 2053, 1015, "770149", "BNL", CustomBlinkChargeRedLED},
    {"touchpadlock", kTouchpad, 2054, 1025, "770146", "BTL", CustomBlinkTouchpadLED},
    {"speakermute", kSpeakerMute, 2055, 1026, "770146", "BSL", BlinkSpeaker},
    {"microphone", kMicrophone, 2056, 1027, "770146", "BML", BlinkMicrophone},
    {"hdgreen", kFirstHdGreen, kHdGreenCommand, kHdButtonCommand, "770106", "BCHD", CustomBlinkCtrlHDLED},
    // Those that are selected by parameters alone.
    {"floppy", kFloppy, 2001, 1001, "770111", "", CustomBlinkFloppyLED},
    {"ide", kIdeDrive, 888, kHdButtonCommand, "770106", "", CustomBlinkIdeHDLED},
    {"scsi", kScsiDrive, 666, kHdButtonCommand, "770106", "", CustomBlinkScsiHDLED},
};

constexpr std::size_t kByParametersAlone = 3;

template <class Predicate>
const LedKind* FindKind(Predicate matches) {
  const auto* found = std::find_if(std::begin(kKinds), std::end(kKinds), matches);
  return found == std::end(kKinds) ? nullptr : found;
}

}  // namespace

std::span<const LedKind> LedKinds() { return std::span(kKinds).first(std::size(kKinds) - kByParametersAlone); }

std::span<const LedKind> AllLedKinds() { return kKinds; }

const LedKind* FindLedKindByFunction(std::string_view function) {
  return FindKind([&](const LedKind& kind) { return kind.function == function; });
}

const LedKind* FindLedKindByStartCommand(std::uint32_t command) {
  return FindKind([&](const LedKind& kind) { return kind.startCommand == command; });
}

const LedKind* FindLedKindByDevice(std::int32_t deviceId) {
  return FindKind([&](const LedKind& kind) { return kind.deviceId == std::min(deviceId, kFirstHdGreen); });
}

}  // namespace panelglow
