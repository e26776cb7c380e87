// What of a screen must be drawn anew when one scene follows another.
#pragma once

#include <map>

#include "platform/desktop/Scene.h"

namespace panelglow::platform::desktop {

/// The smallest rectangle around both; one that holds no pixel adds nothing.
Rectangle Around(const Rectangle& a, const Rectangle& b);

/// The pixels that are in both; of no width or height when there are none.
Rectangle Common(const Rectangle& a, const Rectangle& b);

/// For each top-level window that has changed the area to draw, in screen pixels. A window that is new, has another
/// frame, or has got, lost or reordered children is drawn as a whole.
std::map<WindowHandle, Rectangle> DamageBetween(const Scene& before, const Scene& after);

}  // namespace panelglow::platform::desktop
