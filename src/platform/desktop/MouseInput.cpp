#include "platform/desktop/MouseInput.h"

#include <algorithm>
#include <utility>

namespace panelglow::platform::desktop {

int EdgesAt(const Rectangle& frame, const Rectangle& client, int x, int y) {
  constexpr int kCorner = 12;  // pixels from a corner where both edges are taken
  if (client.Contains(x, y) || !frame.Contains(x, y)) {
    return 0;
  }
  return (x < frame.left + kCorner ? edge::kLeft : 0) | (y < frame.top + kCorner ? edge::kTop : 0) |
         (x >= frame.right - kCorner ? edge::kRight : 0) | (y >= frame.bottom - kCorner ? edge::kBottom : 0);
}

void MouseCapture::Begin(WindowHandle window, const Rectangle& area, int edges, int x, int y) {
  window_ = window;
  area_ = area;
  edges_ = edges;
  x_ = x;
  y_ = y;
}

WindowHandle MouseCapture::TargetOf(ScreenEvent::Kind kind) {
  return kind == ScreenEvent::Kind::kMouseUp ? std::exchange(window_, 0) : window_;
}

Rectangle MouseCapture::DraggedTo(int x, int y) const {
  Rectangle dragged = area_;
  dragged.left += (edges_ & edge::kLeft) != 0 ? x - x_ : 0;
  dragged.right += (edges_ & edge::kRight) != 0 ? x - x_ : 0;
  dragged.top += (edges_ & edge::kTop) != 0 ? y - y_ : 0;
  dragged.bottom += (edges_ & edge::kBottom) != 0 ? y - y_ : 0;
  dragged.right = std::max(dragged.right, dragged.left + 1);
  dragged.bottom = std::max(dragged.bottom, dragged.top + 1);
  return dragged;
}

Rectangle MouseCapture::Anchored(int width, int height) const {
  const int left = (edges_ & edge::kLeft) != 0 ? area_.right - width : area_.left;
  const int top = (edges_ & edge::kTop) != 0 ? area_.bottom - height : area_.top;
  return {left, top, left + width, top + height};
}

bool MouseInput::Note(ScreenEvent::Kind kind, std::uint32_t thread) {
  if (kind == ScreenEvent::Kind::kMouseDown) {
    thread_ = thread;
  }
  if (kind != ScreenEvent::Kind::kMouseMove) {
    down_ = kind == ScreenEvent::Kind::kMouseDown;
    return true;
  }
  return down_;
}

void MouseInput::Forget(WindowHandle window) {
  for (auto& [thread, capture] : captures_) {
    capture.Forget(window);
  }
}

Message MouseMessage(WindowHandle window, const Rectangle& frame, const ScreenEvent& event) {
  const auto packed = static_cast<std::intptr_t>((static_cast<std::uint32_t>(event.y - frame.top) & 0xFFFFU) << 16U |
                                                 (static_cast<std::uint32_t>(event.x - frame.left) & 0xFFFFU));
  switch (event.kind) {
    case ScreenEvent::Kind::kMouseDown:
      return {window, message::kLeftButtonDown, 1, packed};
    case ScreenEvent::Kind::kMouseUp:
      return {window, message::kLeftButtonUp, 0, packed};
    default:
      return {window, message::kMouseMove, 1, packed};
  }
}

}  // namespace panelglow::platform::desktop
