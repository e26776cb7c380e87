// What the mouse does, in two steps: a press, on the screen's side, decides which thread is told of everything until
// the release; that thread finds out which of its windows has the mouse meanwhile, and whether a frame is dragged.
#pragma once

#include <cstdint>
#include <map>

#include "platform/Desktop.h"
#include "platform/desktop/Screen.h"

namespace panelglow::platform::desktop {

/// Edges of a frame, as bits.
namespace edge {
inline constexpr int kLeft = 1;
inline constexpr int kTop = 2;
inline constexpr int kRight = 4;
inline constexpr int kBottom = 8;
}  // namespace edge

/// Which edges of a sizing frame a point is on; 0 between it and the client area, and outside. Near a corner both are
/// taken.
int EdgesAt(const Rectangle& frame, const Rectangle& client, int x, int y);

/// What a thread does with the mouse while its button is down.
class MouseCapture {
 public:
  /// The button goes down on a window of this area, or with `edges` on its sizing frame.
  void Begin(WindowHandle window, const Rectangle& area, int edges, int x, int y);

  /// The window that has the mouse; 0 for none. A release is its last event.
  WindowHandle TargetOf(ScreenEvent::Kind kind);

  [[nodiscard]] bool IsDragging() const { return edges_ != 0; }

  /// The area that the dragged window is to have with the mouse there. The frame does not slip away from the mouse:
  /// what a limit keeps it from is made up for when the mouse comes back.
  [[nodiscard]] Rectangle DraggedTo(int x, int y) const;

  /// Where the dragged window goes when it has another size than it was dragged to: the edge that is not dragged
  /// stays where it was.
  [[nodiscard]] Rectangle Anchored(int width, int height) const;

  void Forget(WindowHandle window) { window_ = window_ == window ? 0 : window_; }

 private:
  WindowHandle window_ = 0;
  Rectangle area_;  // as the button went down
  int edges_ = 0;
  int x_ = 0;
  int y_ = 0;
};

class MouseInput {
 public:
  /// `thread`: the one of the window under the mouse, which counts for a press. True when the event is anybody's:
  /// Thread()'s.
  bool Note(ScreenEvent::Kind kind, std::uint32_t thread);
  [[nodiscard]] std::uint32_t Thread() const { return thread_; }

  MouseCapture& CaptureOf(std::uint32_t thread) { return captures_[thread]; }
  void RemoveThread(std::uint32_t thread) { captures_.erase(thread); }
  void Forget(WindowHandle window);

 private:
  bool down_ = false;
  std::uint32_t thread_ = 0;  // that was pressed on last
  std::map<std::uint32_t, MouseCapture> captures_;
};

/// The message that a window gets of a mouse event; `frame` is the window's on the screen.
Message MouseMessage(WindowHandle window, const Rectangle& frame, const ScreenEvent& event);

}  // namespace panelglow::platform::desktop
