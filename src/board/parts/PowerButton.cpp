#include "board/parts/PowerButton.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kPressed = 0x01;          // of the status; cleared by writing it
constexpr std::uint8_t kButtonOverride = 0x02;   // of the control byte
constexpr std::uint8_t kButtonIsLatched = 0x01;  // of the control byte

}  // namespace

void PowerButton::Save() {
  if (!savedControl) {
    savedControl = devio->InportByte(ports.control);
  }
}

void PowerButton::Arm() {
  Save();
  const auto control = static_cast<std::uint8_t>((*savedControl & ~kButtonOverride) | kButtonIsLatched);
  devio->OutportByte(ports.control, control);
  if (!savedEnable) {
    savedEnable = devio->InportWord(ports.enable);
  }
  devio->OutportWord(ports.enable, 0);
  devio->OutportByte(ports.status, kPressed);
}

bool PowerButton::IsPressed() const { return (devio->InportByte(ports.status) & kPressed) != 0; }

void PowerButton::Restore() {
  if (savedEnable) {
    devio->OutportByte(ports.status, kPressed);
    devio->OutportWord(ports.enable, *savedEnable);
  }
  if (savedControl) {
    devio->OutportByte(ports.control, *savedControl);
  }
  savedEnable.reset();
  savedControl.reset();
}

}  // namespace panelglow
