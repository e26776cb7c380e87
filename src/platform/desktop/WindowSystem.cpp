#include "platform/desktop/WindowSystem.h"

#include <algorithm>
#include <utility>

#include "platform/desktop/WindowRecords.h"

namespace panelglow::platform::desktop {

namespace {

// Places and sizes are 16-bit numbers on the home system: what lies beyond is cut to that.
int Coordinate(int value) { return std::clamp(value, -32768, 32767); }

Rectangle PlaceOf(int x, int y, int width, int height) {
  const int left = Coordinate(x);
  const int top = Coordinate(y);
  return {left, top, left + Coordinate(width), top + Coordinate(height)};
}

WindowKind KindOf(std::string_view className, std::uint32_t style) {
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
    switch (style & style::kStaticTypeMask) {
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

}  // namespace

WindowSystem::WindowSystem(WindowHost& host, int screenWidth, int screenHeight)
    : host_(host), screenWidth_(screenWidth), screenHeight_(screenHeight) {}

WindowSystem::~WindowSystem() = default;

WindowSystem::Window* WindowSystem::Find(WindowHandle window) const {
  const auto found = windows_.find(window);
  return found == windows_.end() ? nullptr : found->second.get();
}

WindowSystem::Queue& WindowSystem::QueueOf(std::uint32_t thread) {
  std::unique_ptr<Queue>& queue = queues_[thread];
  if (!queue) {
    queue = std::make_unique<Queue>();
  }
  return *queue;
}

// ---- classes and windows

bool WindowSystem::RegisterWindowClass(const WindowClass& windowClass) {
  return classes_.emplace(windowClass.name, std::make_shared<const WindowClass>(windowClass)).second;
}

void WindowSystem::UnregisterWindowClass(std::string_view name) {
  const auto found = classes_.find(name);
  if (found != classes_.end()) {
    classes_.erase(found);  // windows of the class keep it alive
  }
}

WindowHandle WindowSystem::CreateWindow(const WindowRequest& request) {
  if (!HasScreen()) {
    host_.Spend();
    return 0;
  }
  const WindowKind kind = KindOf(request.className, request.style);
  const auto found = classes_.find(request.className);
  if (kind == WindowKind::kPlain && found == classes_.end()) {
    return 0;
  }
  auto owned = std::make_unique<Window>();
  Window& window = *owned;
  window.handle = nextWindow_++;
  window.thread = host_.CurrentThread();
  window.kind = kind;
  if (kind == WindowKind::kPlain) {
    window.windowClass = found->second;
    window.procedure = found->second->procedure;
    window.extra.resize(found->second->extraWords);
  } else {
    window.procedure = [this](const Message& message) {
      std::intptr_t result = 0;
      host_.RunInside([&] { result = ControlProcedure(message); });
      return result;
    };
  }
  window.style = request.style;
  window.topmost = (request.extendedStyle & style::kExTopmost) != 0;
  window.enabled = (request.style & style::kDisabled) == 0;
  window.area = PlaceOf(request.x, request.y, request.width, request.height);
  window.parent = request.parent;
  window.text = request.text;
  const WindowHandle handle = window.handle;
  windows_.emplace(handle, std::move(owned));
  Changed();
  if (Window* parent = Find(request.parent)) {
    parent->children.push_back(handle);
  } else {
    order_.push_back(handle);
    Raise(handle, window.topmost ? ZOrder::kTopmost : ZOrder::kTop);
  }
  QueueOf(host_.CurrentThread());
  const bool visible = (request.style & style::kVisible) != 0;
  if (kind == WindowKind::kPlain) {
    if (Call({handle, message::kCreate, 0, request.creationParameter}) == -1 || Find(handle) == nullptr ||
        !HasScreen()) {
      DestroyWindow(handle);
      return 0;
    }
    SendSize(handle);
  } else {
    AskForColor(handle);
  }
  // Not before: a window whose creation waits for something is not there for anybody yet.
  if (visible) {
    ShowWindow(handle, true);
  }
  Invalidate(handle);
  if (request.parent == 0 && IsWindowVisible(handle)) {
    SetForegroundWindow(handle);
  }
  return handle;
}

void WindowSystem::DestroyWindow(WindowHandle handle) {
  Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  if (window->procedure) {
    Call({handle, message::kDestroy, 0, 0});
  }
  window = Find(handle);
  if (window == nullptr) {
    return;
  }
  for (const WindowHandle child : std::vector<WindowHandle>(window->children)) {
    DestroyWindow(child);
  }
  for (auto& [thread, queue] : queues_) {
    std::erase_if(queue->timers, [&](const Timer& timer) { return timer.window == handle; });
    std::erase_if(queue->posted, [&](const Message& message) { return message.window == handle; });
    queue->focus = queue->focus == handle ? 0 : queue->focus;
    queue->active = queue->active == handle ? 0 : queue->active;
  }
  if (Window* parent = Find(window->parent)) {
    std::erase(parent->children, handle);
  }
  std::erase(order_, handle);
  windows_.erase(handle);
  captured_ = captured_ == handle ? 0 : captured_;
  Changed();
  if (foreground_ == handle) {
    const auto visible =
        std::find_if(order_.rbegin(), order_.rend(), [&](WindowHandle w) { return Find(w)->visible; });
    foreground_ = visible == order_.rend() ? 0 : *visible;
  }
}

void WindowSystem::EndThread() {
  const std::uint32_t thread = host_.CurrentThread();
  std::vector<WindowHandle> own;
  for (const auto& [handle, window] : windows_) {
    if (window->thread == thread && window->parent == 0) {
      own.push_back(handle);
    }
  }
  for (const WindowHandle handle : own) {
    DestroyWindow(handle);
  }
  queues_.erase(thread);
}

void WindowSystem::Raise(WindowHandle handle, ZOrder order) {
  Window* window = Find(handle);
  if (window == nullptr || window->parent != 0) {
    return;
  }
  const bool wasTopmost = window->topmost;
  const std::vector<WindowHandle> before = order_;
  window->topmost = wasTopmost || order == ZOrder::kTopmost;
  std::erase(order_, handle);
  auto place = order_.end();
  if (!window->topmost) {
    place = std::find_if(order_.begin(), order_.end(), [&](WindowHandle other) { return Find(other)->topmost; });
  }
  order_.insert(place, handle);
  if (order_ != before || window->topmost != wasTopmost) {
    Changed();
  }
}

void WindowSystem::SetWindowPosition(WindowHandle handle, ZOrder order, int x, int y, int width, int height,
                                     std::uint32_t flags) {
  Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  Rectangle area = window->area;
  if ((flags & position::kNoMove) == 0) {
    area = {x, y, x + area.Width(), y + area.Height()};
  }
  if ((flags & position::kNoSize) == 0) {
    area.right = area.left + width;
    area.bottom = area.top + height;
  }
  if ((flags & position::kNoZOrder) == 0) {
    Raise(handle, order);
  }
  if ((flags & position::kShowWindow) != 0) {
    ShowWindow(handle, true);
  }
  MoveWindow(handle, area.left, area.top, area.Width(), area.Height());
}

void WindowSystem::MoveWindow(WindowHandle handle, int x, int y, int width, int height) {
  Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  TrackLimits limits{0, 0, 0, 0};
  if ((window->style & style::kSizeFrame) != 0) {
    Call({handle, message::kGetMinMaxInfo, 0, reinterpret_cast<std::intptr_t>(&limits)});
    width = std::max(width, limits.minimumWidth);
    height = std::max(height, limits.minimumHeight);
    width = limits.maximumWidth > 0 ? std::min(width, limits.maximumWidth) : width;
    height = limits.maximumHeight > 0 ? std::min(height, limits.maximumHeight) : height;
    window = Find(handle);
    if (window == nullptr) {
      return;
    }
  }
  const Rectangle before = window->area;
  window->area = PlaceOf(x, y, width, height);
  if (before == window->area) {
    return;
  }
  Changed();
  if (before.Width() != width || before.Height() != height) {
    SendSize(handle);
    Invalidate(handle);
  }
}

void WindowSystem::SendSize(WindowHandle handle) {
  const Window* window = Find(handle);
  if (window == nullptr || window->kind != WindowKind::kPlain) {
    return;
  }
  const Rectangle client = ClientRectangle(handle);
  const auto packed = static_cast<std::intptr_t>((static_cast<std::uint32_t>(client.Height() & 0xFFFF) << 16U) |
                                                 static_cast<std::uint32_t>(client.Width() & 0xFFFF));
  Call({handle, message::kSize, 0, packed});
}

// Asked once, when a button or a text is created: the windows of this program do not change their colours.
void WindowSystem::AskForColor(WindowHandle control) {
  const Window* window = Find(control);
  if (window->kind != WindowKind::kButton && window->kind != WindowKind::kStatic) {
    return;
  }
  const std::uint32_t question =
      window->kind == WindowKind::kButton ? message::kControlColorButton : message::kControlColorStatic;
  const std::intptr_t answer = Send({window->parent, question, 0, static_cast<std::intptr_t>(control)});
  if (Window* asked = Find(control); asked != nullptr && answer != 0) {
    asked->ownBackground = static_cast<Color>(answer & 0x00FFFFFF);
  }
}

}  // namespace panelglow::platform::desktop
