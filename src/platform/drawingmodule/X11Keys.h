// What the display says of a key, as windows know keys.
#pragma once

#include <X11/Xlib.h>

#include <cstdint>

namespace panelglow::platform::desktop {

/// The key's code in Keys.h; letters and digits have their upper-case character as code, unknown keys 0.
std::uint32_t VirtualKeyOf(KeySym symbol);

}  // namespace panelglow::platform::desktop
