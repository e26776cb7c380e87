#include "platform/desktop/WindowProperties.h"

#include <utility>

namespace panelglow::platform::desktop {

bool WindowProperties::RegisterWindowClass(const WindowClass& windowClass) {
  return classes_.emplace(windowClass.name, std::make_shared<const WindowClass>(windowClass)).second;
}

void WindowProperties::UnregisterWindowClass(std::string_view name) {
  const auto found = classes_.find(name);
  if (found != classes_.end()) {
    classes_.erase(found);  // windows of the class keep it alive
  }
}

std::shared_ptr<const WindowClass> WindowProperties::FindClass(std::string_view name) const {
  const auto found = classes_.find(name);
  return found == classes_.end() ? nullptr : found->second;
}

bool WindowProperties::IsWindowEnabled(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  return window != nullptr && window->enabled;
}

Rectangle WindowProperties::WindowRectangle(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  return window == nullptr ? Rectangle{} : window->area;
}

wstring WindowProperties::WindowText(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  return window == nullptr ? wstring() : TextOf(*window);
}

void WindowProperties::SetWindowText(WindowHandle handle, std::u16string_view text) {
  if (Window* window = tree_.Find(handle)) {
    SetTextOf(*window, text);
    Changed();
  }
}

void WindowProperties::SetFont(WindowHandle handle, const Font& font) {
  if (Window* window = tree_.Find(handle)) {
    window->font = font;
    Changed();
  }
}

void WindowProperties::SetIcon(WindowHandle handle, std::u16string_view path) {
  if (Window* window = tree_.Find(handle); window != nullptr && window->kind == WindowKind::kIcon) {
    window->iconPath = path;
    Changed();
  }
}

void WindowProperties::SetControlId(WindowHandle handle, int id) {
  if (Window* window = tree_.Find(handle)) {
    window->id = id;
  }
}

int WindowProperties::ControlId(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  return window == nullptr ? 0 : window->id;
}

void WindowProperties::SetExtraWord(WindowHandle handle, std::size_t index, std::intptr_t value) {
  if (Window* window = tree_.Find(handle); window != nullptr && index < window->extra.size()) {
    window->extra[index] = value;
  }
}

std::intptr_t WindowProperties::ExtraWord(WindowHandle handle, std::size_t index) {
  const Window* window = tree_.Find(handle);
  return window != nullptr && index < window->extra.size() ? window->extra[index] : 0;
}

WindowProcedure WindowProperties::SetProcedure(WindowHandle handle, WindowProcedure procedure) {
  Window* window = tree_.Find(handle);
  return window == nullptr ? WindowProcedure() : std::exchange(window->procedure, std::move(procedure));
}

WindowHandle WindowProperties::Parent(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  return window == nullptr ? 0 : window->parent;
}

std::vector<WindowHandle> WindowProperties::Children(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  return window == nullptr ? std::vector<WindowHandle>{} : window->children;
}

void WindowProperties::SetScroll(WindowHandle handle, const ScrollState& state) {
  Window* window = tree_.Find(handle);
  if (auto* bar = window == nullptr ? nullptr : std::get_if<ScrollBarControl>(&window->control)) {
    bar->SetScroll(state);
    Changed();
  }
}

ScrollState WindowProperties::Scroll(WindowHandle handle) {
  const Window* window = tree_.Find(handle);
  const auto* bar = window == nullptr ? nullptr : std::get_if<ScrollBarControl>(&window->control);
  return bar == nullptr ? ScrollState{} : bar->Scroll();
}

}  // namespace panelglow::platform::desktop
