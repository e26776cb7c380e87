// Who has the keyboard: of each thread the focused and the active window, and of all of them the foreground one.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/Desktop.h"

namespace panelglow::platform::desktop {

class FocusState {
 public:
  struct OfThread {
    WindowHandle focus = 0;
    WindowHandle active = 0;
    /// Where keys go: to the focused window, or else the active one.
    [[nodiscard]] WindowHandle KeyTarget() const { return focus != 0 ? focus : active; }
  };

  OfThread& Of(std::uint32_t thread) { return threads_[thread]; }

  /// Every thread's focused window, of those that have one.
  [[nodiscard]] std::vector<WindowHandle> Focused() const;

  [[nodiscard]] WindowHandle Foreground() const { return foreground_; }

  /// A window comes to the foreground, from another program's window too.
  void TakeForeground(WindowHandle window);

  /// Another program's window has the foreground, until one of ours takes it.
  void LoseForeground(std::u16string_view title) { foreign_ = title; }
  [[nodiscard]] const std::optional<std::u16string>& Foreign() const { return foreign_; }  // its title

  /// How often the foreground was taken.
  [[nodiscard]] std::uint64_t Requests() const { return requests_; }

  /// A window is gone; when it had the foreground, `next` has it, which may be 0.
  void Forget(WindowHandle window, WindowHandle next);
  void RemoveThread(std::uint32_t thread) { threads_.erase(thread); }

 private:
  std::map<std::uint32_t, OfThread> threads_;
  WindowHandle foreground_ = 0;
  std::optional<std::u16string> foreign_;
  std::uint64_t requests_ = 0;
};

}  // namespace panelglow::platform::desktop
