// What is kept of a window.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/ButtonControl.h"
#include "platform/desktop/EditControl.h"
#include "platform/desktop/Scene.h"
#include "platform/desktop/ScrollBarControl.h"

namespace panelglow::platform::desktop {

struct Window {
  WindowHandle handle = 0;
  std::uint32_t thread = 0;
  std::shared_ptr<const WindowClass> windowClass;  // null for a built-in control
  WindowKind kind = WindowKind::kPlain;
  std::variant<std::monostate, ButtonControl, EditControl, ScrollBarControl> control;
  WindowProcedure procedure;
  std::uint32_t style = 0;
  bool topmost = false;
  bool visible = false;
  bool enabled = true;
  bool dirty = false;  // is to paint itself
  Rectangle area;      // client coordinates of the parent, or the screen
  WindowHandle parent = 0;
  std::vector<WindowHandle> children;
  int id = 0;
  std::vector<std::intptr_t> extra;
  wstring text;  // but of an entry field, which has its own
  wstring iconPath;
  std::optional<Color> ownBackground;
  Font font;
  std::vector<DrawOperation> operations;
};

/// The kind, and the control of that kind, that a class name and a style stand for.
WindowKind KindOf(std::string_view className, std::uint32_t windowStyle);

/// A window of the request's place, texts and style, not yet anywhere. `windowClass` is null for a built-in control.
std::unique_ptr<Window> MakeWindow(const WindowRequest& request, std::shared_ptr<const WindowClass> windowClass);

[[nodiscard]] const wstring& TextOf(const Window& window);
void SetTextOf(Window& window, std::u16string_view text);

/// What a built-in control does with a message; the control of a plain window and of a label does nothing.
ControlEffects HandleByControl(Window& window, const Message& message);

/// Places and sizes are 16-bit numbers on the home system: what lies beyond is cut to that.
[[nodiscard]] Rectangle PlaceOf(int x, int y, int width, int height);

/// Width of the frame on each side, in pixels: a sizing frame, a dialog frame, a thin border, or none.
[[nodiscard]] int FrameWidth(const Window& window);

}  // namespace panelglow::platform::desktop
