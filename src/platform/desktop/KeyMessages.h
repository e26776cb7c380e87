// The messages that a key makes, and a text that comes in whole.
#pragma once

#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/Screen.h"

namespace panelglow::platform::desktop {

/// For the window that has the keyboard, in their order: the key's own, and one for each unit of what it types. A
/// text without a key is characters alone, of its first line.
std::vector<Message> KeyMessages(WindowHandle window, const ScreenEvent& event);

}  // namespace panelglow::platform::desktop
