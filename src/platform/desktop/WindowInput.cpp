// What mouse and keyboard did: from the screen into the queue of the thread that it is for, and out of it again.
#include <algorithm>
#include <utility>

#include "platform/desktop/WindowRecords.h"

namespace panelglow::platform::desktop {

namespace {

// Edges of a frame that the mouse drags.
constexpr int kLeftEdge = 1;
constexpr int kTopEdge = 2;
constexpr int kRightEdge = 4;
constexpr int kBottomEdge = 8;

}  // namespace

WindowHandle WindowSystem::WindowAt(int x, int y) const {
  const auto isThere = [&](WindowHandle window) {
    return Find(window)->visible && ScreenRectangle(window).Contains(x, y);
  };
  // Labels and disabled controls leave clicks to their parent.
  const auto takesClick = [&](WindowHandle window) {
    const WindowKind kind = Find(window)->kind;
    return Find(window)->enabled && isThere(window) &&
           (kind == WindowKind::kPlain || kind == WindowKind::kButton || kind == WindowKind::kEdit ||
            kind == WindowKind::kScrollBar);
  };
  const auto top = std::find_if(order_.rbegin(), order_.rend(), isThere);
  WindowHandle deepest = top == order_.rend() ? 0 : *top;
  for (bool deeper = deepest != 0; deeper;) {
    const std::vector<WindowHandle>& children = Find(deepest)->children;
    const auto child = std::find_if(children.rbegin(), children.rend(), takesClick);
    deeper = child != children.rend();
    deepest = deeper ? *child : deepest;
  }
  return deepest;
}

void WindowSystem::Click(int x, int y) {
  MouseButton(x, y, true);
  MouseButton(x, y, false);
}

void WindowSystem::Take(const ScreenEvent& event) {
  using Kind = ScreenEvent::Kind;
  switch (event.kind) {
    case Kind::kMouseDown:
    case Kind::kMouseUp:
      MouseButton(event.x, event.y, event.kind == Kind::kMouseDown);
      break;
    case Kind::kMouseMove:
      MouseMove(event.x, event.y);
      break;
    case Kind::kKeyDown:
    case Kind::kKeyUp:
      PushKey(event);
      break;
    case Kind::kForegroundLost:
      LoseForeground(event.title);
      break;
  }
}

void WindowSystem::MouseButton(int x, int y, bool down) {
  if (down) {
    const Window* window = Find(WindowAt(x, y));
    mouseThread_ = window == nullptr ? 0 : window->thread;
  }
  mouseDown_ = down;
  PushMouse(down ? ScreenEvent::Kind::kMouseDown : ScreenEvent::Kind::kMouseUp, x, y);
}

void WindowSystem::MouseMove(int x, int y) {
  if (mouseDown_) {
    PushMouse(ScreenEvent::Kind::kMouseMove, x, y);
  }
}

// To the thread whose window the button went down on. Of moves without anything between them the last one counts.
void WindowSystem::PushMouse(ScreenEvent::Kind kind, int x, int y) {
  const auto found = queues_.find(mouseThread_);
  if (found == queues_.end()) {
    return;
  }
  std::deque<ScreenEvent>& waiting = found->second->input;
  ScreenEvent input;
  input.kind = kind;
  input.x = x;
  input.y = y;
  if (kind == ScreenEvent::Kind::kMouseMove && !waiting.empty() && waiting.back().kind == kind) {
    waiting.pop_back();
  }
  waiting.push_back(std::move(input));
  host_.Wake(found->second.get());
}

void WindowSystem::Broadcast(std::uint32_t id, std::uintptr_t wParam) {
  for (const WindowHandle handle : std::vector<WindowHandle>(order_)) {
    Post({handle, id, wParam, 0});
  }
}

void WindowSystem::KeyDown(std::uint32_t virtualKey, char16_t character, bool alt, bool repeat) {
  ScreenEvent input;
  input.virtualKey = virtualKey;
  input.character = character;
  input.alt = alt;
  input.repeat = repeat;
  PushKey(input);
}

void WindowSystem::KeyUp(std::uint32_t virtualKey, bool alt) {
  ScreenEvent input;
  input.kind = ScreenEvent::Kind::kKeyUp;
  input.virtualKey = virtualKey;
  input.alt = alt;
  PushKey(input);
}

void WindowSystem::Key(std::uint32_t virtualKey, char16_t character, bool alt) {
  KeyDown(virtualKey, character, alt, false);
  KeyUp(virtualKey, alt);
}

void WindowSystem::PushKey(const ScreenEvent& input) {
  if (const Window* window = Find(foreground_)) {
    Queue& queue = QueueOf(window->thread);
    queue.input.push_back(input);
    host_.Wake(&queue);
  }
}

bool WindowSystem::TakeInput(Queue& queue, Message& message) {
  using Kind = ScreenEvent::Kind;
  while (!queue.input.empty()) {
    const ScreenEvent input = std::move(queue.input.front());
    queue.input.pop_front();
    const bool isKey = input.kind == Kind::kKeyDown || input.kind == Kind::kKeyUp;
    if (isKey ? TakeKey(queue, input, message) : TakeMouse(input, message)) {
      return true;
    }
  }
  return false;
}

bool WindowSystem::TakeKey(Queue& queue, const ScreenEvent& input, Message& message) {
  const WindowHandle target = queue.focus != 0 ? queue.focus : queue.active;
  if (target == 0) {
    return false;
  }
  if (input.kind == ScreenEvent::Kind::kKeyUp) {
    message = {target, input.alt ? message::kSysKeyUp : message::kKeyUp, input.virtualKey, key_data::kWasDown};
    return true;
  }
  const std::intptr_t data = input.repeat ? key_data::kWasDown : 0;
  message = {target, input.alt ? message::kSysKeyDown : message::kKeyDown, input.virtualKey, data};
  if (input.character != 0) {
    queue.posted.push_front({target, input.alt ? message::kSysChar : message::kChar, input.character, data});
  }
  return true;
}

bool WindowSystem::TakeMouse(const ScreenEvent& input, Message& message) {
  if (input.kind == ScreenEvent::Kind::kMouseDown) {
    captured_ = WindowAt(input.x, input.y);
    if (const Window* window = Find(captured_)) {
      dragEdges_ = FrameEdgesAt(*window, input.x, input.y);
      dragX_ = input.x;
      dragY_ = input.y;
      SetForegroundWindow(TopLevelOf(captured_));
    }
  }
  const WindowHandle target = captured_;
  if (input.kind == ScreenEvent::Kind::kMouseUp) {
    captured_ = 0;
  }
  const Window* window = Find(target);
  if (window == nullptr || window->thread != host_.CurrentThread()) {
    return false;
  }
  if (dragEdges_ != 0) {
    if (input.kind == ScreenEvent::Kind::kMouseMove) {
      captured_ = target;
      DragFrame(input.x, input.y);
    }
    return false;
  }
  const Rectangle frame = ScreenRectangle(target);
  const auto packed = static_cast<std::intptr_t>((static_cast<std::uint32_t>(input.y - frame.top) & 0xFFFFU) << 16U |
                                                 (static_cast<std::uint32_t>(input.x - frame.left) & 0xFFFFU));
  switch (input.kind) {
    case ScreenEvent::Kind::kMouseDown:
      message = {target, message::kLeftButtonDown, 1, packed};
      break;
    case ScreenEvent::Kind::kMouseUp:
      message = {target, message::kLeftButtonUp, 0, packed};
      break;
    default:
      message = {target, message::kMouseMove, 1, packed};
      break;
  }
  return true;
}

// Which edges of a sizing frame a point is on, as bits; 0 for none.
int WindowSystem::FrameEdgesAt(const Window& window, int x, int y) const {
  constexpr int kCorner = 12;  // pixels from a corner where both edges are taken
  if ((window.style & style::kSizeFrame) == 0) {
    return 0;
  }
  const Rectangle frame = ScreenRectangle(window.handle);
  if (ClientOnScreen(window).Contains(x, y)) {
    return 0;
  }
  return (x < frame.left + kCorner ? kLeftEdge : 0) | (y < frame.top + kCorner ? kTopEdge : 0) |
         (x >= frame.right - kCorner ? kRightEdge : 0) | (y >= frame.bottom - kCorner ? kBottomEdge : 0);
}

void WindowSystem::DragFrame(int x, int y) {
  const Window* window = Find(captured_);
  const int dx = x - dragX_;
  const int dy = y - dragY_;
  const Rectangle before = window->area;
  Rectangle area = before;
  area.left += (dragEdges_ & kLeftEdge) != 0 ? dx : 0;
  area.right += (dragEdges_ & kRightEdge) != 0 ? dx : 0;
  area.top += (dragEdges_ & kTopEdge) != 0 ? dy : 0;
  area.bottom += (dragEdges_ & kBottomEdge) != 0 ? dy : 0;
  const WindowHandle handle = captured_;
  MoveWindow(handle, area.left, area.top, std::max(1, area.Width()), std::max(1, area.Height()));
  window = Find(handle);
  if (window == nullptr) {
    return;
  }
  // The edge that is not dragged stays where it was, also when a limit keeps the window from following the mouse.
  Rectangle now = window->area;
  const int left = (dragEdges_ & kLeftEdge) != 0 ? before.right - now.Width() : before.left;
  const int top = (dragEdges_ & kTopEdge) != 0 ? before.bottom - now.Height() : before.top;
  if (left != now.left || top != now.top) {
    MoveWindow(handle, left, top, now.Width(), now.Height());
  }
  dragX_ = x;
  dragY_ = y;
}

}  // namespace panelglow::platform::desktop
