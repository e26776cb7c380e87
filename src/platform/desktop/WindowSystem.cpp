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

// Width of the frame on each side, by style: a sizing frame, a dialog frame, a thin border.
int FrameWidth(std::uint32_t windowStyle) {
  if ((windowStyle & style::kSizeFrame) != 0) {
    return 4;
  }
  if ((windowStyle & style::kDialogFrame) != 0) {
    return 3;
  }
  return (windowStyle & style::kBorder) != 0 ? 1 : 0;
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

void WindowSystem::ShowWindow(WindowHandle handle, bool visible) {
  if (Window* window = Find(handle); window != nullptr && window->visible != visible) {
    window->visible = visible;
    Changed();
    Invalidate(handle);
  }
}

void WindowSystem::EnableWindow(WindowHandle handle, bool enabled) {
  Window* window = Find(handle);
  if (window == nullptr || window->enabled == enabled) {
    return;
  }
  window->enabled = enabled;
  Changed();
  Queue& queue = QueueOf(window->thread);
  if (!enabled && queue.focus == handle) {
    queue.focus = 0;
    Call({handle, message::kKillFocus, 0, 0});
  }
}

bool WindowSystem::IsWindowEnabled(WindowHandle handle) {
  const Window* window = Find(handle);
  return window != nullptr && window->enabled;
}

bool WindowSystem::IsShown(const Window& window) const {
  const Window* at = &window;
  while (at != nullptr && at->visible) {
    if (at->parent == 0) {
      return true;
    }
    at = Find(at->parent);
  }
  return false;
}

bool WindowSystem::IsWindowVisible(WindowHandle handle) {
  const Window* window = Find(handle);
  return window != nullptr && IsShown(*window);
}

Rectangle WindowSystem::WindowRectangle(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? Rectangle{} : window->area;
}

Rectangle WindowSystem::ClientRectangle(WindowHandle handle) {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return {};
  }
  const int frame = FrameWidth(window->style);
  return {0, 0, std::max(0, window->area.Width() - 2 * frame), std::max(0, window->area.Height() - 2 * frame)};
}

Rectangle WindowSystem::ClientOnScreen(const Window& window) const {
  const Rectangle frame = ScreenRectangle(window.handle);
  const int width = FrameWidth(window.style);
  return {frame.left + width, frame.top + width, std::max(frame.left + width, frame.right - width),
          std::max(frame.top + width, frame.bottom - width)};
}

Rectangle WindowSystem::ScreenRectangle(WindowHandle handle) const {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return {};
  }
  Rectangle area = window->area;
  if (const Window* parent = Find(window->parent)) {
    const Rectangle outer = ScreenRectangle(parent->handle);
    const int frame = FrameWidth(parent->style);
    const int dx = outer.left + frame;
    const int dy = outer.top + frame;
    area = {area.left + dx, area.top + dy, area.right + dx, area.bottom + dy};
  }
  return area;
}

wstring WindowSystem::WindowText(WindowHandle handle) {
  if (handle == kForeignWindow) {
    return foreign_.value_or(wstring());
  }
  const Window* window = Find(handle);
  return window == nullptr ? wstring() : window->text;
}

void WindowSystem::SetWindowText(WindowHandle handle, std::u16string_view text) {
  if (Window* window = Find(handle)) {
    window->text = text;
    window->caret = 0;
    Changed();
  }
}

void WindowSystem::SetFont(WindowHandle handle, const Font& font) {
  if (Window* window = Find(handle)) {
    window->font = font;
    Changed();
  }
}

void WindowSystem::SetIcon(WindowHandle handle, std::u16string_view path) {
  if (Window* window = Find(handle); window != nullptr && window->kind == WindowKind::kIcon) {
    window->iconPath = path;
    Changed();
  }
}

void WindowSystem::SetControlId(WindowHandle handle, int id) {
  if (Window* window = Find(handle)) {
    window->id = id;
  }
}

int WindowSystem::ControlId(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? 0 : window->id;
}

void WindowSystem::SetExtraWord(WindowHandle handle, std::size_t index, std::intptr_t value) {
  if (Window* window = Find(handle); window != nullptr && index < window->extra.size()) {
    window->extra[index] = value;
  }
}

std::intptr_t WindowSystem::ExtraWord(WindowHandle handle, std::size_t index) {
  const Window* window = Find(handle);
  return window != nullptr && index < window->extra.size() ? window->extra[index] : 0;
}

WindowProcedure WindowSystem::SetProcedure(WindowHandle handle, WindowProcedure procedure) {
  Window* window = Find(handle);
  if (window == nullptr) {
    return {};
  }
  return std::exchange(window->procedure, std::move(procedure));
}

WindowHandle WindowSystem::Parent(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? 0 : window->parent;
}

std::vector<WindowHandle> WindowSystem::Children(WindowHandle handle) {
  const Window* window = Find(handle);
  return window == nullptr ? std::vector<WindowHandle>{} : window->children;
}

WindowHandle WindowSystem::FindControl(WindowHandle parent, int id) {
  const Window* window = Find(parent);
  if (window == nullptr) {
    return 0;
  }
  const auto found = std::find_if(window->children.begin(), window->children.end(),
                                  [&](WindowHandle c) { return Find(c)->id == id; });
  return found == window->children.end() ? 0 : *found;
}

WindowHandle WindowSystem::TopLevelOf(WindowHandle handle) const {
  const Window* window = Find(handle);
  while (window != nullptr && window->parent != 0) {
    window = Find(window->parent);
  }
  return window == nullptr ? 0 : window->handle;
}

bool WindowSystem::IsDescendant(WindowHandle ancestor, WindowHandle handle) const {
  for (const Window* window = Find(handle); window != nullptr; window = Find(window->parent)) {
    if (window->handle == ancestor) {
      return true;
    }
  }
  return false;
}

void WindowSystem::Invalidate(WindowHandle handle) {
  if (Window* window = Find(handle); window != nullptr && window->kind == WindowKind::kPlain) {
    window->dirty = true;
    host_.Wake(&QueueOf(window->thread));
  }
}

Rectangle WindowSystem::MeasureText(std::u16string_view text, int width, const Font& font) {
  SceneDrawing* drawing = drawing_ ? drawing_() : nullptr;
  if (drawing == nullptr) {
    return {0, 0, width, font.height};
  }
  const auto [w, h] = drawing->MeasureText(text, width, font, language_);
  return {0, 0, w, h};
}

void WindowSystem::SetScroll(WindowHandle bar, const ScrollState& state) {
  if (Window* window = Find(bar)) {
    window->scroll = state;
    const int highest = std::max(state.minimum, state.maximum - std::max(0, state.page - 1));
    window->scroll.position = std::clamp(state.position, state.minimum, highest);
    Changed();
  }
}

ScrollState WindowSystem::Scroll(WindowHandle bar) {
  const Window* window = Find(bar);
  return window == nullptr ? ScrollState{} : window->scroll;
}

}  // namespace panelglow::platform::desktop
