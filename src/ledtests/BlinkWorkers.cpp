#include "ledtests/BlinkWorkers.h"

#include <exception>
#include <functional>
#include <memory>
#include <string>
#include <utility>

#include "board/MotherBoard.h"
#include "harness/base/CDMException.h"
#include "harness/base/CDMout.h"
#include "ledtests/CustomLEDTest.h"
#include "ledtests/LedKind.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr int kMostCycles = 50;
constexpr std::uint32_t kLockKeyPhase_ms = 200;
constexpr std::uint32_t kPhase_ms = 500;
constexpr std::uint32_t kLegacyHdPhase_ms = 1500;

CustomLEDTest& TheTest() { return *g_pSuperPtrCustom; }

void Sleep(std::uint32_t milliseconds) { platform::TheHost().clock.Sleep(milliseconds); }

void LogEnd(const std::string& reason) {
  CDMout::LogMessage(LogOptions::DeviceErrors, kFreeText, "A LED could not be blinked: " + reason);
}

// Puts something back when the scope is left, however it is left. A worker that is told to end in the middle of
// putting back does it once more, undisturbed: after that nothing interrupts the thread any more.
class PutBack {
 public:
  explicit PutBack(std::function<void()> action) : action_(std::move(action)) {}
  ~PutBack() {
    try {
      Act();
    } catch (const platform::ThreadTerminated&) {
      Act();
    }
  }
  PutBack(const PutBack&) = delete;
  PutBack& operator=(const PutBack&) = delete;

 private:
  void Act() {
    try {
      action_();
    } catch (const std::exception& failure) {
      LogEnd(failure.what());
    }
  }

  std::function<void()> action_;
};

// The common loop: at most 50 cycles of an on phase and an off phase, while the entry's `running` is set. A worker
// that is told to end in an on phase still switches off: not every LED is saved and restored.
void BlinkLoop(const LEDStruct& entry, std::uint32_t phase_ms, const std::function<void()>& switchOn,
               const std::function<void()>& switchOff) {
  for (int cycle = 0; cycle < kMostCycles && entry.running; ++cycle) {
    try {
      switchOn();
      Sleep(phase_ms);
      switchOff();
    } catch (const platform::ThreadTerminated&) {
      switchOff();  // undisturbed now
      throw;
    }
    Sleep(phase_ms);
  }
}

void Nothing() {}

std::unique_ptr<MotherBoard> MakeBoard() {
  const CustomLEDTest& test = TheTest();
  return MotherBoard::Instantiate(test.iniFile, test.testIni, test.chipIni, "platform", "");
}

// ---- lock keys

struct LockKey {
  std::uint8_t virtualKey;
  std::uint8_t scanCode;
};
constexpr LockKey kNumLockKey{144, 69};
constexpr LockKey kCapsLockKey{20, 58};
constexpr LockKey kScrollLockKey{145, 70};

// A press and its release. `toggled`: the key's LED is not as it was found; it changes with the press. A key that is
// pressed is released in any case.
void Toggle(const LockKey& key, bool& toggled) {
  using platform::Keyboard;
  Keyboard& keyboard = platform::TheHost().keyboard;
  const auto release = [&] {
    keyboard.Event(key.virtualKey, key.scanCode, Keyboard::kExtendedKey | Keyboard::kKeyUp);
  };
  keyboard.Event(key.virtualKey, key.scanCode, Keyboard::kExtendedKey);
  toggled = !toggled;
  try {
    release();
  } catch (const platform::ThreadTerminated&) {
    release();  // undisturbed now
    throw;
  }
}

void CustomToggleNumLock(bool& toggled) { Toggle(kNumLockKey, toggled); }
void CustomToggleCapsLock(bool& toggled) { Toggle(kCapsLockKey, toggled); }
void CustomToggleScrollLock(bool& toggled) { Toggle(kScrollLockKey, toggled); }

void BlinkLockKey(std::int32_t deviceId, void (*toggle)(bool& toggled)) {
  LEDStruct* entry = TheTest().FindDevice(deviceId);
  if (entry == nullptr) {
    return;
  }
  entry->workerStarted = true;
  bool toggled = false;
  const auto putBack = [&] {
    if (toggled) {
      toggle(toggled);
    }
  };
  BlinkLoop(
      *entry, kLockKeyPhase_ms, [&] { toggle(toggled); }, putBack);
  entry->workerFinished = true;
}

// ---- board LEDs

using BoardCall = bool (MotherBoard::*)();

// What sets the board workers apart.
struct BoardLed {
  std::int32_t deviceId;
  BoardCall save;
  BoardCall blink;  // starts a blink that the chip does by itself; null: this LED has none
  BoardCall switchOn;
  BoardCall switchOff;
  BoardCall restore;
};

constexpr BoardLed kRedPowerLed{kPowerRed,
                                &MotherBoard::SavePowerLedState,
                                &MotherBoard::BlinkPowerLedRed,
                                &MotherBoard::AssertPowerLedRed,
                                &MotherBoard::DeassertPowerLed,
                                &MotherBoard::RestorePowerLedState};
constexpr BoardLed kGreenPowerLed{kPowerGreen,
                                  &MotherBoard::SavePowerLedState,
                                  &MotherBoard::BlinkPowerLedGreen,
                                  &MotherBoard::AssertPowerLedGreen,
                                  &MotherBoard::DeassertPowerLed,
                                  &MotherBoard::RestorePowerLedState};
constexpr BoardLed kRedHdLed{kHdRed,
                             &MotherBoard::SaveHdLedState,
                             &MotherBoard::BlinkHdLedRed,
                             &MotherBoard::AssertHdLedRed,
                             &MotherBoard::DeassertHdLedRed,
                             &MotherBoard::RestoreHdLedState};
constexpr BoardLed kWhiteChargeLed{kChargeGreen,
                                   &MotherBoard::SaveChargeLedState,
                                   &MotherBoard::BlinkChargeLedWhite,
                                   &MotherBoard::AssertChargeLedWhite,
                                   &MotherBoard::DeassertChargeLedWhite,
                                   &MotherBoard::RestoreChargeLedState};
constexpr BoardLed kRedChargeLed{kChargeRed,
                                 &MotherBoard::SaveChargeLedState,
                                 &MotherBoard::BlinkChargeLedRed,
                                 &MotherBoard::AssertChargeLedRed,
                                 &MotherBoard::DeassertChargeLedRed,
                                 &MotherBoard::RestoreChargeLedState};
constexpr BoardLed kSpeakerLed{kSpeakerMute,
                               &MotherBoard::SaveSpeakerLedState,
                               nullptr,
                               &MotherBoard::AssertSpeakerLed,
                               &MotherBoard::DeassertSpeakerLed,
                               &MotherBoard::RestoreSpeakerLedState};
constexpr BoardLed kMicrophoneLed{kMicrophone,
                                  &MotherBoard::SaveSpeakerLedState,
                                  nullptr,
                                  &MotherBoard::AssertMicrophoneLed,
                                  &MotherBoard::DeassertMicrophoneLed,
                                  &MotherBoard::RestoreSpeakerLedState};

// The loop over a board's LED. While the chip blinks it by itself the loop only keeps time.
void BlinkBoardLed(MotherBoard& board, const BoardLed& led, const LEDStruct& entry, bool selfBlink) {
  const std::function<void()> nothing = Nothing;
  BlinkLoop(
      entry, kPhase_ms, selfBlink ? nothing : [&] { (board.*led.switchOn)(); },
      selfBlink ? nothing : [&] { (board.*led.switchOff)(); });
}

// The power LEDs save first and ask for the chip's own blink once the worker counts as started.
void BlinkPowerLed(const BoardLed& led, BlinkWorker legacy) {
  std::unique_ptr<MotherBoard> board = MakeBoard();
  if (!board) {
    board = MotherBoard::Instance(TheTest().iniFile);
  }
  if (!board || board->IsPanelLedLegacy()) {
    board.reset();  // not needed further: others need not wait for it
    legacy();
    return;
  }
  LEDStruct* entry = nullptr;
  (board.get()->*led.save)();
  {
    const PutBack restore([&] { (board.get()->*led.restore)(); });
    entry = TheTest().FindDevice(led.deviceId);
    if (entry != nullptr) {
      entry->workerStarted = true;
      const bool selfBlink = (board.get()->*led.blink)();
      BlinkBoardLed(*board, led, *entry, selfBlink);
    }
  }
  board.reset();
  if (entry != nullptr) {
    entry->workerFinished = true;
  }
}

// The legacy power LEDs: the lines are in software's hands for the loop, and given back behind it.
void BlinkLegacyPowerLed(std::int32_t deviceId, void (LegacyPanelPorts::*assertLed)()) {
  LegacyPanelPorts& ports = TheTest().legacyPorts;
  LEDStruct* entry = nullptr;
  {
    const PutBack restore([&] {
      ports.CustomSetGreenPwrLedNativeMode();
      ports.CustomSetRedPwrLedNativeMode();
    });
    ports.CustomSetGreenPwrLedGpioMode();
    ports.CustomSetRedPwrLedGpioMode();
    entry = TheTest().FindDevice(deviceId);
    if (entry != nullptr) {
      entry->workerStarted = true;
      BlinkLoop(
          *entry, kPhase_ms, [&] { (ports.*assertLed)(); }, [&] { ports.CustomDeassertPwrLeds(); });
    }
  }
  if (entry != nullptr) {
    entry->workerFinished = true;
  }
}

void BlinkLegacyHdLed(LEDStruct& entry) {
  LegacyPanelPorts& ports = TheTest().legacyPorts;
  {
    const PutBack restore([&] {
      ports.CustomSetGreenPwrLedNativeMode();
      ports.CustomSetRedPwrLedNativeMode();
    });
    ports.CustomSetGreenPwrLedGpioMode();
    ports.CustomSetRedPwrLedGpioMode();
    ports.CustomDeassertHdLed();
    ports.CustomAssertRedPwrLed();
    entry.workerStarted = true;
    BlinkLoop(
        entry, kLegacyHdPhase_ms, [&] { ports.CustomAssertRedHdLed(); }, [&] { ports.CustomDeassertHdLed(); });
  }
  entry.workerFinished = true;
}

// Without a board the worker ends at once; nothing blinks, and the operator's answer decides.
void BlinkChargeLed(const BoardLed& led) {
  std::unique_ptr<MotherBoard> board = MakeBoard();
  LEDStruct* entry = TheTest().FindDevice(led.deviceId);
  if (!board || entry == nullptr) {
    return;
  }
  entry->workerStarted = true;
  const bool selfBlink = (board.get()->*led.blink)();
  (board.get()->*led.save)();
  {
    const PutBack restore([&] { (board.get()->*led.restore)(); });
    board->DeassertChargeLedWhite();
    board->DeassertChargeLedRed();
    BlinkBoardLed(*board, led, *entry, selfBlink);
  }
  board.reset();
  entry->workerFinished = true;
}

bool BlinkAudioLed(const BoardLed& led) {
  std::unique_ptr<MotherBoard> board = MakeBoard();
  LEDStruct* entry = TheTest().FindDevice(led.deviceId);
  if (!board || entry == nullptr) {
    return false;
  }
  entry->workerStarted = true;
  (board.get()->*led.save)();
  {
    const PutBack restore([&] { (board.get()->*led.restore)(); });
    BlinkBoardLed(*board, led, *entry, false);
  }
  board.reset();
  entry->workerFinished = true;
  return true;
}

// ---- touchpad

constexpr std::int32_t kAnyConnection = 0;
constexpr std::int32_t kTypeTouchpad = 2;
constexpr std::uint32_t kTouchpadLedProperty = 0x10000171;

std::unique_ptr<platform::TouchpadDevice> OpenTouchpad(platform::TouchpadApi& api) {
  std::int32_t handle = -1;
  if (!api.FindDevice(kAnyConnection, kTypeTouchpad, handle)) {
    return nullptr;
  }
  return api.OpenDevice(handle);
}

void BlinkTouchpad(LEDStruct& entry) {
  const std::unique_ptr<platform::TouchpadApi> api = platform::TheHost().touchpad.Create();
  if (!api) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "Could not obtain a Synaptics API object.\n");
    return;
  }
  const std::unique_ptr<platform::TouchpadDevice> device = OpenTouchpad(*api);
  if (!device) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "Unable to find a Synaptics TouchPad.\n");
    return;
  }
  entry.workerStarted = true;
  const auto set = [&](std::int32_t value) { device->SetProperty(kTouchpadLedProperty, value); };
  const PutBack off([&] { set(0); });
  BlinkLoop(
      entry, kPhase_ms, [&] { set(1); }, [&] { set(0); });
}

// What a failure says, for the log.
std::string TextOf(const CDMException& failure) {
  std::string text = "code " + std::to_string(failure.code);
  for (const auto& message : failure.GetMessages()) {
    text += ", " + message->GetText();
  }
  return text;
}

}  // namespace

void CustomBlinkNoLED() {
  LEDStruct* entry = TheTest().FindDevice(kNoLed);
  if (entry == nullptr) {
    return;
  }
  entry->workerStarted = true;
  BlinkLoop(*entry, kPhase_ms, Nothing, Nothing);
  CDMout::LogMessage(LogOptions::Status, kFreeText, "NoB Thread Exited");
  entry->workerFinished = true;
}

void CustomBlinkNumLockLED() { BlinkLockKey(kNumLock, CustomToggleNumLock); }
void CustomBlinkCapsLockLED() { BlinkLockKey(kCapsLock, CustomToggleCapsLock); }
void CustomBlinkScrollLockLED() { BlinkLockKey(kScrollLock, CustomToggleScrollLock); }

void CustomBlinkRedPowerLED() { BlinkPowerLed(kRedPowerLed, CustomBlinkRedPowerLED_Legacy); }
void CustomBlinkGreenPowerLED() { BlinkPowerLed(kGreenPowerLed, CustomBlinkGreenPowerLED_Legacy); }

void CustomBlinkRedPowerLED_Legacy() { BlinkLegacyPowerLed(kPowerRed, &LegacyPanelPorts::CustomAssertRedPwrLed); }
void CustomBlinkGreenPowerLED_Legacy() {
  BlinkLegacyPowerLed(kPowerGreen, &LegacyPanelPorts::CustomAssertGreenPwrLed);
}

void CustomBlinkRedHDLED() {
  std::unique_ptr<MotherBoard> board = MakeBoard();
  LEDStruct* entry = TheTest().FindDevice(kHdRed);
  if (entry == nullptr) {
    return;
  }
  if (!board) {
    BlinkLegacyHdLed(*entry);
    return;
  }
  entry->workerStarted = true;
  const bool selfBlink = board->BlinkHdLedRed();
  board->SaveHdLedState();
  {
    const PutBack restore([&] { board->RestoreHdLedState(); });
    BlinkBoardLed(*board, kRedHdLed, *entry, selfBlink);
  }
  board.reset();
  entry->workerFinished = true;
}

void CustomBlinkChargeLED() { BlinkChargeLed(kWhiteChargeLed); }
void CustomBlinkChargeRedLED() { BlinkChargeLed(kRedChargeLed); }
bool CustomBlinkSpeakerLed() { return BlinkAudioLed(kSpeakerLed); }
bool CustomBlinkMicrophoneLed() { return BlinkAudioLed(kMicrophoneLed); }

void CustomBlinkTouchpadLED() {
  CDMout::LogMessage(LogOptions::Status, kFreeText, "BTL: Method Start");
  LEDStruct* entry = TheTest().FindDevice(kTouchpad);
  if (entry == nullptr) {
    return;
  }
  BlinkTouchpad(*entry);
  entry->workerFinished = true;
  CDMout::LogMessage(LogOptions::Status, kFreeText, "BTL: Method End");
}

BlinkWorker FindBlinkWorker(std::int32_t deviceId) {
  switch (deviceId) {
    case kNoLed:
      return CustomBlinkNoLED;
    case kNumLock:
      return CustomBlinkNumLockLED;
    case kCapsLock:
      return CustomBlinkCapsLockLED;
    case kScrollLock:
      return CustomBlinkScrollLockLED;
    case kHdRed:
      return CustomBlinkRedHDLED;
    case kPowerRed:
      return CustomBlinkRedPowerLED;
    case kPowerGreen:
      return CustomBlinkGreenPowerLED;
    case kChargeGreen:
      return CustomBlinkChargeLED;
    case kChargeRed:
      return CustomBlinkChargeRedLED;
    case kTouchpad:
      return CustomBlinkTouchpadLED;
    case kSpeakerMute:
      return [] { CustomBlinkSpeakerLed(); };
    case kMicrophone:
      return [] { CustomBlinkMicrophoneLed(); };
    default:
      return nullptr;
  }
}

void RunBlinkWorker(BlinkWorker worker) {
  try {
    worker();
  } catch (CDMException* failure) {
    const std::unique_ptr<CDMException> owned(failure);
    LogEnd(TextOf(*owned));
  } catch (const CDMException& failure) {
    LogEnd(TextOf(failure));
  } catch (const std::exception& failure) {
    LogEnd(failure.what());
  } catch (const std::string& text) {
    LogEnd(text);
  }
}

}  // namespace panelglow
