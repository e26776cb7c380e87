// The workers of the three lock keys, whose LEDs follow the key.
#include <cstdint>

#include "ledtests/BlinkLoop.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/LEDStruct.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kLockKeyPhase_ms = 200;

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

void BlinkLockKey(LEDStruct& entry, void (*toggle)(bool& toggled)) {
  entry.workerStarted = true;
  bool toggled = false;
  const auto putBack = [&] {
    if (toggled) {
      toggle(toggled);
    }
  };
  BlinkLoop(
      entry, kLockKeyPhase_ms, [&] { toggle(toggled); }, putBack);
  entry.workerFinished = true;
}

}  // namespace

void CustomBlinkNumLockLED(FrontPanelTest& /*test*/, LEDStruct& entry) { BlinkLockKey(entry, CustomToggleNumLock); }
void CustomBlinkCapsLockLED(FrontPanelTest& /*test*/, LEDStruct& entry) { BlinkLockKey(entry, CustomToggleCapsLock); }
void CustomBlinkScrollLockLED(FrontPanelTest& /*test*/, LEDStruct& entry) {
  BlinkLockKey(entry, CustomToggleScrollLock);
}

}  // namespace panelglow
