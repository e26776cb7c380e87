// A push button: what mouse and Space have begun on it.
#pragma once

#include "platform/Desktop.h"
#include "platform/desktop/ControlEffects.h"

namespace panelglow::platform::desktop {

class ButtonControl {
 public:
  /// `frame`: the button's own, with its left top corner at 0.
  ControlEffects Handle(const Message& message, const Rectangle& frame);

  /// The keyboard belongs to another program now, and with it the release of a key that is held.
  ControlEffects LoseKeyboard();

  [[nodiscard]] bool IsPressed() const { return pressed_; }

 private:
  ControlEffects OnKey(const Message& message);
  ControlEffects Show(bool pressed);

  bool pressed_ = false;    // as it is seen
  bool mouseHeld_ = false;  // the mouse button went down on it
  bool spaceHeld_ = false;
};

}  // namespace panelglow::platform::desktop
