// The workers of LEDs that the board library drives. A worker has a board of its own, which holds the library's lock
// for as long as it exists.
#include <functional>
#include <memory>
#include <utility>

#include "board/MotherBoard.h"
#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/PutBack.h"

namespace panelglow {

namespace {

using BoardCall = bool (MotherBoard::*)();

// What sets the board's LEDs apart.
struct BoardLed {
  BoardCall save;
  BoardCall blink;  // starts a blink that the chip does by itself; null: this LED has none
  BoardCall switchOn;
  BoardCall switchOff;
  BoardCall restore;
};

constexpr BoardLed kRedPowerLed{&MotherBoard::SavePowerLedState, &MotherBoard::BlinkPowerLedRed,
                                &MotherBoard::AssertPowerLedRed, &MotherBoard::DeassertPowerLed,
                                &MotherBoard::RestorePowerLedState};
constexpr BoardLed kGreenPowerLed{&MotherBoard::SavePowerLedState, &MotherBoard::BlinkPowerLedGreen,
                                  &MotherBoard::AssertPowerLedGreen, &MotherBoard::DeassertPowerLed,
                                  &MotherBoard::RestorePowerLedState};
constexpr BoardLed kRedHdLed{&MotherBoard::SaveHdLedState, &MotherBoard::BlinkHdLedRed, &MotherBoard::AssertHdLedRed,
                             &MotherBoard::DeassertHdLedRed, &MotherBoard::RestoreHdLedState};
constexpr BoardLed kWhiteChargeLed{&MotherBoard::SaveChargeLedState, &MotherBoard::BlinkChargeLedWhite,
                                   &MotherBoard::AssertChargeLedWhite, &MotherBoard::DeassertChargeLedWhite,
                                   &MotherBoard::RestoreChargeLedState};
constexpr BoardLed kRedChargeLed{&MotherBoard::SaveChargeLedState, &MotherBoard::BlinkChargeLedRed,
                                 &MotherBoard::AssertChargeLedRed, &MotherBoard::DeassertChargeLedRed,
                                 &MotherBoard::RestoreChargeLedState};
constexpr BoardLed kSpeakerLed{&MotherBoard::SaveSpeakerLedState, nullptr, &MotherBoard::AssertSpeakerLed,
                               &MotherBoard::DeassertSpeakerLed, &MotherBoard::RestoreSpeakerLedState};
constexpr BoardLed kMicrophoneLed{&MotherBoard::SaveSpeakerLedState, nullptr, &MotherBoard::AssertMicrophoneLed,
                                  &MotherBoard::DeassertMicrophoneLed, &MotherBoard::RestoreSpeakerLedState};

void Call(MotherBoard& board, BoardCall operation) { (board.*operation)(); }

// The loop over a board's LED. While the chip blinks it by itself the loop only keeps time.
void BlinkBoardLed(MotherBoard& board, const BoardLed& led, const LEDStruct& entry, bool selfBlink) {
  const std::function<void()> nothing = [] {};
  BlinkLoop(
      entry, kPhase_ms, selfBlink ? nothing : [&] { Call(board, led.switchOn); },
      selfBlink ? nothing : [&] { Call(board, led.switchOff); });
}

// Runs `steps` with the LED's state kept by a guard that stands before the first step, then gives the board up: the
// next worker may have it before this one counts as finished.
void WithBoardLed(std::unique_ptr<MotherBoard> board, const BoardLed& led, LEDStruct& entry,
                  const std::function<void(MotherBoard&)>& steps) {
  {
    const PutBack restore([&] { Call(*board, led.restore); });
    steps(*board);
  }
  board.reset();
  entry.workerFinished = true;
}

// The power LEDs save first and ask for the chip's own blink once the worker counts as started.
void BlinkPowerLed(FrontPanelTest& test, LEDStruct& entry, const BoardLed& led, BlinkWorker legacy) {
  std::unique_ptr<MotherBoard> board = test.MakeAnyBoard();
  if (!board || board->IsPanelLedLegacy()) {
    board.reset();  // not needed further: others need not wait for it
    legacy(test, entry);
    return;
  }
  WithBoardLed(std::move(board), led, entry, [&](MotherBoard& owned) {
    Call(owned, led.save);
    entry.workerStarted = true;
    BlinkBoardLed(owned, led, entry, (owned.*led.blink)());
  });
}

// Without a board the worker ends at once; nothing blinks, and the operator's answer decides.
void BlinkChargeLed(FrontPanelTest& test, LEDStruct& entry, const BoardLed& led) {
  std::unique_ptr<MotherBoard> board = test.MakeBoard();
  if (!board) {
    return;
  }
  entry.workerStarted = true;
  WithBoardLed(std::move(board), led, entry, [&](MotherBoard& owned) {
    const bool selfBlink = (owned.*led.blink)();
    Call(owned, led.save);
    owned.DeassertChargeLedWhite();
    owned.DeassertChargeLedRed();
    BlinkBoardLed(owned, led, entry, selfBlink);
  });
}

bool BlinkAudioLed(FrontPanelTest& test, LEDStruct& entry, const BoardLed& led) {
  std::unique_ptr<MotherBoard> board = test.MakeBoard();
  if (!board) {
    return false;
  }
  entry.workerStarted = true;
  WithBoardLed(std::move(board), led, entry, [&](MotherBoard& owned) {
    Call(owned, led.save);
    BlinkBoardLed(owned, led, entry, false);
  });
  return true;
}

}  // namespace

void CustomBlinkRedPowerLED(FrontPanelTest& test, LEDStruct& entry) {
  BlinkPowerLed(test, entry, kRedPowerLed, CustomBlinkRedPowerLED_Legacy);
}

void CustomBlinkGreenPowerLED(FrontPanelTest& test, LEDStruct& entry) {
  BlinkPowerLed(test, entry, kGreenPowerLed, CustomBlinkGreenPowerLED_Legacy);
}

void CustomBlinkRedHDLED(FrontPanelTest& test, LEDStruct& entry) {
  std::unique_ptr<MotherBoard> board = test.MakeBoard();
  if (!board) {
    CustomBlinkRedHDLED_Legacy(test, entry);
    return;
  }
  entry.workerStarted = true;
  WithBoardLed(std::move(board), kRedHdLed, entry, [&](MotherBoard& owned) {
    const bool selfBlink = owned.BlinkHdLedRed();
    owned.SaveHdLedState();
    BlinkBoardLed(owned, kRedHdLed, entry, selfBlink);
  });
}

void CustomBlinkChargeLED(FrontPanelTest& test, LEDStruct& entry) { BlinkChargeLed(test, entry, kWhiteChargeLed); }
void CustomBlinkChargeRedLED(FrontPanelTest& test, LEDStruct& entry) { BlinkChargeLed(test, entry, kRedChargeLed); }
bool CustomBlinkSpeakerLed(FrontPanelTest& test, LEDStruct& entry) { return BlinkAudioLed(test, entry, kSpeakerLed); }
bool CustomBlinkMicrophoneLed(FrontPanelTest& test, LEDStruct& entry) {
  return BlinkAudioLed(test, entry, kMicrophoneLed);
}

}  // namespace panelglow
