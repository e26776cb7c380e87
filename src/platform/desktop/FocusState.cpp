#include "platform/desktop/FocusState.h"

namespace panelglow::platform::desktop {

std::vector<WindowHandle> FocusState::Focused() const {
  std::vector<WindowHandle> focused;
  for (const auto& [thread, state] : threads_) {
    if (state.focus != 0) {
      focused.push_back(state.focus);
    }
  }
  return focused;
}

void FocusState::TakeForeground(WindowHandle window) {
  foreground_ = window;
  foreign_.reset();
  ++requests_;
}

void FocusState::Forget(WindowHandle window, WindowHandle next) {
  for (auto& [thread, state] : threads_) {
    state.focus = state.focus == window ? 0 : state.focus;
    state.active = state.active == window ? 0 : state.active;
  }
  foreground_ = foreground_ == window ? next : foreground_;
}

}  // namespace panelglow::platform::desktop
