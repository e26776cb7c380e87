// What the window logic keeps of a window and of a thread's messages; seen by its own sources alone.
#pragma once

#include <deque>
#include <memory>
#include <optional>
#include <vector>

#include "platform/desktop/WindowSystem.h"

namespace panelglow::platform::desktop {

struct WindowSystem::Window {
  WindowHandle handle = 0;
  std::uint32_t thread = 0;
  std::shared_ptr<const WindowClass> windowClass;  // null for a built-in control
  WindowKind kind = WindowKind::kPlain;
  WindowProcedure procedure;
  std::uint32_t style = 0;
  bool topmost = false;
  bool visible = false;
  bool enabled = true;
  bool dirty = false;
  bool pressed = false;
  bool mouseHeld = false;                    // the button went down on it
  bool spaceHeld = false;                    // of a button
  std::optional<std::uint32_t> heldRequest;  // of a scroll bar: what an arrow or the track asks for while it is held
  std::size_t caret = 0;                     // of an entry field
  Rectangle area;                            // client coordinates of the parent, or the screen
  WindowHandle parent = 0;
  std::vector<WindowHandle> children;
  int id = 0;
  std::vector<std::intptr_t> extra;
  wstring text;
  wstring iconPath;
  std::optional<Color> ownBackground;
  Font font;
  ScrollState scroll;
  std::vector<DrawOperation> operations;
};

struct WindowSystem::Queue {
  std::deque<Message> posted;
  std::deque<std::shared_ptr<SentMessage>> sent;
  std::deque<ScreenEvent> input;
  std::vector<Timer> timers;
  WindowHandle focus = 0;
  WindowHandle active = 0;
  bool quit = false;
};

}  // namespace panelglow::platform::desktop
