#include "platform/desktop/Window.h"

#include <algorithm>
#include <utility>

namespace panelglow::platform::desktop {

WindowKind KindOf(std::string_view className, std::uint32_t windowStyle) {
  if (className == "BUTTON") {
    return WindowKind::kButton;
  }
  if (className == "EDIT") {
    return WindowKind::kEdit;
  }
  if (className == "SCROLLBAR") {
    return WindowKind::kScrollBar;
  }
  if (className == "STATIC") {
    switch (windowStyle & style::kStaticTypeMask) {
      case style::kStaticIcon:
        return WindowKind::kIcon;
      case style::kStaticBitmap:
        return WindowKind::kImageArea;
      default:
        return WindowKind::kStatic;
    }
  }
  return WindowKind::kPlain;
}

std::unique_ptr<Window> MakeWindow(const WindowRequest& request, std::shared_ptr<const WindowClass> windowClass) {
  auto window = std::make_unique<Window>();
  window->kind = KindOf(request.className, request.style);
  if (windowClass) {
    window->procedure = windowClass->procedure;
    window->extra.resize(windowClass->extraWords);
    window->windowClass = std::move(windowClass);
  }
  if (window->kind == WindowKind::kButton) {
    window->control.emplace<ButtonControl>();
  } else if (window->kind == WindowKind::kEdit) {
    window->control.emplace<EditControl>();
  } else if (window->kind == WindowKind::kScrollBar) {
    window->control.emplace<ScrollBarControl>((request.style & style::kScrollBarVertical) != 0);
  }
  window->style = request.style;
  window->topmost = (request.extendedStyle & style::kExTopmost) != 0;
  window->enabled = (request.style & style::kDisabled) == 0;
  window->area = PlaceOf(request.x, request.y, request.width, request.height);
  window->parent = request.parent;
  SetTextOf(*window, request.text);
  return window;
}

const wstring& TextOf(const Window& window) {
  const auto* edit = std::get_if<EditControl>(&window.control);
  return edit == nullptr ? window.text : edit->Text();
}

void SetTextOf(Window& window, std::u16string_view text) {
  if (auto* edit = std::get_if<EditControl>(&window.control)) {
    edit->SetText(text);
  } else {
    window.text = text;
  }
}

ControlEffects HandleByControl(Window& window, const Message& message) {
  const Rectangle frame{0, 0, window.area.Width(), window.area.Height()};
  if (auto* button = std::get_if<ButtonControl>(&window.control)) {
    return button->Handle(message, frame);
  }
  if (auto* edit = std::get_if<EditControl>(&window.control)) {
    return edit->Handle(message);
  }
  if (auto* bar = std::get_if<ScrollBarControl>(&window.control)) {
    return bar->Handle(message, frame);
  }
  return {};
}

Rectangle PlaceOf(int x, int y, int width, int height) {
  const auto coordinate = [](int value) { return std::clamp(value, -32768, 32767); };
  const int left = coordinate(x);
  const int top = coordinate(y);
  return {left, top, left + coordinate(width), top + coordinate(height)};
}

int FrameWidth(const Window& window) {
  if ((window.style & style::kSizeFrame) != 0) {
    return 4;
  }
  if ((window.style & style::kDialogFrame) != 0) {
    return 3;
  }
  return (window.style & style::kBorder) != 0 ? 1 : 0;
}

}  // namespace panelglow::platform::desktop
