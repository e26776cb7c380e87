// What the display says of a key, as windows know keys.
#pragma once

#include <X11/Xlib.h>

#include <cstdint>

namespace panelglow::platform::desktop {

/// The key's code in Keys.h; letters and digits have their upper-case character as code, unknown keys 0.
std::uint32_t VirtualKeyOf(KeySym symbol);

/// The first character of a UTF-8 text as one UTF-16 unit, 0 for none and for those that need two.
char16_t FirstCharacter(const char* text, int length);

}  // namespace panelglow::platform::desktop
