// The keyboard rules of a dialog: what a key asks for, found by looking at the windows. Nothing is done here.
#pragma once

#include <cstdint>
#include <optional>

#include "platform/Desktop.h"
#include "platform/desktop/WindowTree.h"

namespace panelglow::platform::desktop {

/// Commands that a dialog gets for Enter without a default button, and for Escape.
inline constexpr std::uintptr_t kOkCommand = 1;
inline constexpr std::uintptr_t kCancelCommand = 2;

/// What a dialog does with a key, in the order of the members; with none of them set the key is used up all the same.
struct DialogAction {
  WindowHandle focus = 0;     // gets the keyboard
  WindowHandle press = 0;     // button to press
  bool pressDefault = false;  // the button that the dialog names, or else kOkCommand
  std::uintptr_t command = 0;
};

/// Nothing when a key's message is the focused window's own. `focus` is the window of the thread that has the
/// keyboard, 0 for none.
std::optional<DialogAction> ActionOf(const WindowTree& tree, WindowHandle dialog, WindowHandle focus,
                                     const Message& message);

/// The dialog's first button of the default style; 0 for none.
WindowHandle DefaultButton(const WindowTree& tree, WindowHandle dialog);

}  // namespace panelglow::platform::desktop
