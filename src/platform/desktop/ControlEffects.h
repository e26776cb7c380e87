// What a built-in control does to the world around it. A control changes nothing but its own state; what it asks for
// beside that it returns, and whoever owns the windows carries it out.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "platform/Desktop.h"

namespace panelglow::platform::desktop {

/// To be carried out in the order of the members.
struct ControlEffects {
  bool changed = false;                     // it looks different now
  bool takesFocus = false;                  // of the keyboard
  std::optional<std::uint32_t> timer_ms;    // a kTimer message is to come, and again each time; 0: none
  bool pressed = false;                     // the parent gets the control's command
  std::vector<std::uintptr_t> scrollWords;  // the `wParam` of each scroll message that the parent gets
};

/// The place that a mouse message names, in pixels from the corner of the control's frame.
inline int XOf(const Message& mouse) { return static_cast<std::int16_t>(mouse.lParam & 0xFFFF); }
inline int YOf(const Message& mouse) { return static_cast<std::int16_t>(mouse.lParam >> 16 & 0xFFFF); }

}  // namespace panelglow::platform::desktop
