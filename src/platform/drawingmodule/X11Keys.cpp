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
constexpr std::array<KeyRow, 21> kKeys{{{XK_BackSpace, key::kBackspace},
                                        {XK_Tab, key::kTab},
                                        {XK_ISO_Left_Tab, key::kTab},
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
                                        {XK_Delete, key::kDelete},
                                        // of the number pad, without Num Lock
                                        {XK_KP_End, key::kEnd},
                                        {XK_KP_Home, key::kHome},
                                        {XK_KP_Left, key::kLeft},
                                        {XK_KP_Up, key::kUp},
                                        {XK_KP_Right, key::kRight},
                                        {XK_KP_Down, key::kDown},
                                        {XK_KP_Delete, key::kDelete}}};

}  // namespace

std::uint32_t VirtualKeyOf(KeySym symbol) {
  const auto* row = std::find_if(kKeys.begin(), kKeys.end(), [&](const KeyRow& key) { return key.symbol == symbol; });
  if (row != kKeys.end()) {
    return row->virtualKey;
  }
  if (symbol >= XK_a && symbol <= XK_z) {
    return static_cast<std::uint32_t>(symbol - XK_a + 'A');
  }
  // Of letters and digits the code is the character. Punctuation has codes of its own, which nothing here asks for;
  // those of its characters belong to other keys.
  const bool isOwnCode = (symbol >= XK_A && symbol <= XK_Z) || (symbol >= XK_0 && symbol <= XK_9);
  return isOwnCode ? static_cast<std::uint32_t>(symbol) : 0;
}

}  // namespace panelglow::platform::desktop
