#include "platform/desktop/ButtonControl.h"

#include <utility>

#include "platform/desktop/Keys.h"

namespace panelglow::platform::desktop {

// A press of the mouse counts when the release is over the button that was pressed, wherever the mouse was in
// between.
ControlEffects ButtonControl::Handle(const Message& message, const Rectangle& frame) {
  switch (message.id) {
    case message::kLeftButtonDown: {
      mouseHeld_ = true;
      ControlEffects effects = Show(true);
      effects.takesFocus = true;
      return effects;
    }
    case message::kMouseMove:
      return mouseHeld_ ? Show(frame.Contains(XOf(message), YOf(message))) : ControlEffects{};
    case message::kLeftButtonUp: {
      ControlEffects effects = Show(false);
      effects.pressed = std::exchange(mouseHeld_, false) && frame.Contains(XOf(message), YOf(message));
      return effects;
    }
    case message::kKillFocus:
    case message::kSysKeyUp:  // a Space that is released with Alt is none
      return LoseKeyboard();
    case message::kKeyDown:
    case message::kKeyUp:
      return message.wParam == key::kSpace ? OnKey(message) : ControlEffects{};
    default:
      return {};
  }
}

// Space presses a button when it is released: held, it presses it once. A key that was already held when the button
// got the focus is not a press of this button.
ControlEffects ButtonControl::OnKey(const Message& message) {
  if (message.id == message::kKeyUp) {
    const bool held = spaceHeld_;
    ControlEffects effects = LoseKeyboard();
    effects.pressed = held;
    return effects;
  }
  if ((message.lParam & key_data::kWasDown) != 0) {
    return {};
  }
  spaceHeld_ = true;
  return Show(true);
}

ControlEffects ButtonControl::LoseKeyboard() {
  return std::exchange(spaceHeld_, false) ? Show(false) : ControlEffects{};
}

ControlEffects ButtonControl::Show(bool pressed) {
  ControlEffects effects;
  effects.changed = std::exchange(pressed_, pressed) != pressed;
  return effects;
}

}  // namespace panelglow::platform::desktop
