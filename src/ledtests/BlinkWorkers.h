// The blink workers of CustomLEDTest: thread functions without arguments that make one LED blink until the operator
// has answered or 50 cycles are over, and leave it as they found it. They talk to the dialog through the flags of
// their entry in the device array; a LED that cannot blink fails in the operator's eyes.
#pragma once

#include <cstdint>

namespace panelglow {

using BlinkWorker = void (*)();

void CustomBlinkNoLED();
void CustomBlinkNumLockLED();
void CustomBlinkCapsLockLED();
void CustomBlinkScrollLockLED();
void CustomBlinkRedPowerLED();
void CustomBlinkGreenPowerLED();
void CustomBlinkRedPowerLED_Legacy();
void CustomBlinkGreenPowerLED_Legacy();
void CustomBlinkRedHDLED();
void CustomBlinkChargeLED();
void CustomBlinkChargeRedLED();
void CustomBlinkTouchpadLED();

/// True when they blinked; false when there is no board.
bool CustomBlinkSpeakerLed();
bool CustomBlinkMicrophoneLed();

/// The worker of a LED kind; null for a kind that has none yet.
BlinkWorker FindBlinkWorker(std::int32_t deviceId);

/// Runs a worker as a thread's body: what ends it by an exception is logged, since nobody waits for its result.
void RunBlinkWorker(BlinkWorker worker);

}  // namespace panelglow
