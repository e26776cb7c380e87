// What windows are and where they stand: states, rectangles, texts, kinship.
#include <algorithm>
#include <utility>

#include "platform/desktop/WindowRecords.h"
#include "platform/desktop/WindowSystem.h"

namespace panelglow::platform::desktop {

namespace {

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

// Where nothing can be drawn, and so nothing measured: as if every character were half as wide as it is high.
Rectangle EstimateText(std::u16string_view text, int width, const Font& font) {
  const int charWidth = std::max(1, font.height / 2);
  const auto most = static_cast<std::size_t>(std::max(1, width / charWidth));  // of a line
  std::size_t lines = 0;
  std::size_t longest = 0;
  for (std::size_t begin = 0; begin <= text.size();) {
    const std::size_t end = std::min(text.find(u'\n', begin), text.size());
    lines += std::max<std::size_t>(1, (end - begin + most - 1) / most);
    longest = std::max(longest, std::min(end - begin, most));
    begin = end + 1;
  }
  return {0, 0, static_cast<int>(longest) * charWidth, static_cast<int>(lines) * font.height};
}

}  // namespace

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
    return EstimateText(text, width, font);
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
