#include "board/parts/PowerEventButton.h"

#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kPressed = 0x0100;   // of the status word; cleared by writing it
constexpr std::uint16_t kNoEvents = 0xFEFE;  // of the enable word: neither the button's nor the timer's
constexpr int kMostReads = 3;
constexpr std::uint32_t kBetweenReads_ms = 100;

}  // namespace

void PowerEventButton::Save() {
  if (!savedEnable) {
    savedEnable = devio->InportWord(EnablePort());
  }
}

bool PowerEventButton::Arm() {
  Save();
  if (check == Check::kNone) {
    devio->OutportWord(EnablePort(), devio->InportWord(EnablePort()) & kNoEvents);
    return true;
  }
  devio->OutportWord(EnablePort(), *savedEnable & kNoEvents);
  return devio->InportWord(EnablePort()) != *savedEnable;
}

bool PowerEventButton::IsPressed() const { return (devio->InportWord(base) & kPressed) != 0; }

bool PowerEventButton::Restore() {
  if (!savedEnable) {
    return true;
  }
  devio->OutportWord(base, kPressed);
  devio->OutportWord(EnablePort(), *savedEnable);
  if (check == Check::kNone) {
    savedEnable.reset();
    return true;
  }
  for (int read = 1; devio->InportWord(EnablePort()) != *savedEnable; ++read) {
    if (read == kMostReads) {
      return false;
    }
    platform::TheHost().clock.Sleep(kBetweenReads_ms);
  }
  savedEnable.reset();
  return true;
}

}  // namespace panelglow
