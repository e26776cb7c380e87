#include "platform/drawingmodule/X11Keys.h"

#include <X11/keysym.h>

#include <algorithm>
#include <array>

#include "platform/desktop/Keys.h"

namespace panelglow::platform::desktop {

namespace {

struct KeyRow {
  KeySym symbol;
  std::uint32_t virtualKey;  // of the home system
};

// Keys that stand for something else than the character they type.
constexpr std::array<KeyRow, 14> kKeys{{{XK_BackSpace, key::kBackspace},
                                        {XK_Tab, key::kTab},
                                        {XK_ISO_Left_Tab, key::kShiftTab},
                                        {XK_Return, key::kEnter},
                                        {XK_KP_Enter, key::kEnter},
                                        {XK_Escape, key::kEscape},
                                        {XK_space, key::kSpace},
                                        {XK_End, key::kEnd},
                                        {XK_Home, key::kHome},
                                        {XK_Left, key::kLeft},
                                        {XK_Up, key::kUp},
                                        {XK_Right, key::kRight},
                                        {XK_Down, key::kDown},
                                        {XK_Delete, key::kDelete}}};

}  // namespace

std::uint32_t VirtualKeyOf(KeySym symbol) {
  const auto* row = std::find_if(kKeys.begin(), kKeys.end(), [&](const KeyRow& key) { return key.symbol == symbol; });
  if (row != kKeys.end()) {
    return row->virtualKey;
  }
  if (symbol >= XK_a && symbol <= XK_z) {
    return static_cast<std::uint32_t>(symbol - XK_a + 'A');
  }
  return symbol < 0x80 ? static_cast<std::uint32_t>(symbol) : 0;
}

char16_t FirstCharacter(const char* text, int length) {
  if (length <= 0) {
    return 0;
  }
  const auto byte = [&](int i) { return static_cast<unsigned>(static_cast<unsigned char>(text[i])); };
  if (byte(0) < 0x80) {
    return static_cast<char16_t>(byte(0));
  }
  if ((byte(0) & 0xE0U) == 0xC0 && length >= 2) {
    return static_cast<char16_t>((byte(0) & 0x1FU) << 6U | (byte(1) & 0x3FU));
  }
  if ((byte(0) & 0xF0U) == 0xE0 && length >= 3) {
    return static_cast<char16_t>((byte(0) & 0x0FU) << 12U | (byte(1) & 0x3FU) << 6U | (byte(2) & 0x3FU));
  }
  return 0;
}

}  // namespace panelglow::platform::desktop
