// The blink workers: thread functions that make one LED blink until the operator has answered or 50 cycles are over,
// and leave it as they found it. They talk to the dialog through the flags of their entry in the device array; a LED
// that cannot blink fails in the operator's eyes.
#pragma once

#include <cstdint>
#include <string>

namespace panelglow {

class FrontPanelTest;
struct LEDStruct;

/// The entry is one of the test's device array and stays where it is for as long as the worker runs.
using BlinkWorker = void (*)(FrontPanelTest& test, LEDStruct& entry);

void CustomBlinkNoLED(FrontPanelTest& test, LEDStruct& entry);

// Lock keys, by full presses: both on and off of a lock key are a toggle.
void CustomBlinkNumLockLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkCapsLockLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkScrollLockLED(FrontPanelTest& test, LEDStruct& entry);

// LEDs of the board library; the power LEDs and the red drive LED fall back to fixed registers without a board.
void CustomBlinkRedPowerLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkGreenPowerLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkRedHDLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkChargeLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkChargeRedLED(FrontPanelTest& test, LEDStruct& entry);

/// True when they blinked; false when there is no board.
bool CustomBlinkSpeakerLed(FrontPanelTest& test, LEDStruct& entry);
bool CustomBlinkMicrophoneLed(FrontPanelTest& test, LEDStruct& entry);

// The fixed registers of machines whose board the INI files do not know.
void CustomBlinkRedPowerLED_Legacy(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkGreenPowerLED_Legacy(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkRedHDLED_Legacy(FrontPanelTest& test, LEDStruct& entry);

void CustomBlinkTouchpadLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkWebcamLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkFloppyLED(FrontPanelTest& test, LEDStruct& entry);

// The network LED: on the board where it has one, otherwise by an adapter's link.
void CustomBlinkNetworkLED(FrontPanelTest& test, LEDStruct& entry);

/// True when the board has done the whole blink.
bool CustomBlinkNotebookWirelessLed(FrontPanelTest& test, LEDStruct& entry);

// Drive LEDs: of a disk on the entry's controller, and of the first disk of a type.
void CustomBlinkCtrlHDLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkIdeHDLED(FrontPanelTest& test, LEDStruct& entry);
void CustomBlinkScsiHDLED(FrontPanelTest& test, LEDStruct& entry);

/// The activity thread of a drive LED: reads and writes back one block of the drive, over and over, until the test's
/// thread state is no longer 1. Sets the state to 2 when the drive cannot be used.
void CustomLightUpFpHddLed(FrontPanelTest& test, const std::string& drive);

/// Runs a worker as a thread's body: what ends it by an exception is logged, since nobody waits for its result.
void RunBlinkWorker(BlinkWorker worker, FrontPanelTest& test, LEDStruct& entry);

}  // namespace panelglow
