// Which windows there are: their kinship, which lies on which, and where they stand.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/Window.h"

namespace panelglow::platform::desktop {

class WindowTree {
 public:
  /// Gives the window its handle, and its place among its parent's children or on top of all windows.
  Window& Add(std::unique_ptr<Window> window);

  /// Takes a window out, which has no children any more.
  void Remove(WindowHandle window);

  /// Null for a handle that names none.
  [[nodiscard]] Window* Find(WindowHandle window) const;

  /// Brings a top-level window up: above all others when it is topmost or becomes so, below the topmost ones
  /// otherwise. False when nothing changes.
  bool Raise(WindowHandle window, ZOrder order);

  /// Top-level windows, bottom-most first.
  [[nodiscard]] const std::vector<WindowHandle>& Order() const { return order_; }
  [[nodiscard]] std::vector<WindowHandle> VisibleTopLevels() const;

  [[nodiscard]] std::vector<WindowHandle> TopLevelsOf(std::uint32_t thread) const;
  [[nodiscard]] WindowHandle TopLevelOf(WindowHandle window) const;
  [[nodiscard]] bool IsDescendant(WindowHandle ancestor, WindowHandle window) const;
  [[nodiscard]] WindowHandle ChildWithId(WindowHandle parent, int id) const;  // 0 for none
  [[nodiscard]] bool IsShown(WindowHandle window) const;                      // it and all that it lies in

  /// The first window of a thread that is shown and is to paint itself; 0 for none.
  [[nodiscard]] WindowHandle ToPaint(std::uint32_t thread) const;

  /// Rectangles: frame and client area on the screen, and the client area in its own coordinates.
  [[nodiscard]] Rectangle FrameOnScreen(WindowHandle window) const;
  [[nodiscard]] Rectangle ClientOnScreen(WindowHandle window) const;
  [[nodiscard]] Rectangle Client(WindowHandle window) const;

  /// The window that a click at a point of the screen goes to; 0 for none. Labels and disabled controls leave clicks
  /// to their parent.
  [[nodiscard]] WindowHandle At(int x, int y) const;

  /// Calls `visit` with every window.
  template <class Visit>
  void ForEach(Visit visit) {
    for (const auto& [handle, window] : windows_) {
      visit(*window);
    }
  }

 private:
  std::map<WindowHandle, std::unique_ptr<Window>> windows_;
  std::vector<WindowHandle> order_;
  WindowHandle next_ = 1;
};

}  // namespace panelglow::platform::desktop
