// A display that people look at: shows scenes, and says what mouse and keyboard did.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/desktop/Scene.h"

namespace panelglow::platform::desktop {

struct ScreenEvent {
  enum class Kind { kMouseDown, kMouseUp, kMouseMove, kKeyDown, kKeyUp, kText, kForegroundLost };
  Kind kind = Kind::kKeyDown;
  int x = 0;  // screen pixels
  int y = 0;
  std::uint32_t virtualKey = 0;  // see Keys.h
  char16_t character = 0;        // what the key types, 0 for none
  bool alt = false;
  bool shift = false;
  bool repeat = false;   // the key was down already: it is held
  std::u16string text;   // of kText: no key typed it, but an input method or the clipboard gave it whole
  std::u16string title;  // of another program's window that has the keyboard now or covers ours; empty if unknown
};

inline bool IsMouse(const ScreenEvent& event) {
  using Kind = ScreenEvent::Kind;
  return event.kind == Kind::kMouseDown || event.kind == Kind::kMouseUp || event.kind == Kind::kMouseMove;
}

inline ScreenEvent MouseEvent(ScreenEvent::Kind kind, int x, int y) {
  ScreenEvent event;
  event.kind = kind;
  event.x = x;
  event.y = y;
  return event;
}

class Screen {
 public:
  virtual ~Screen() = default;

  [[nodiscard]] virtual int Width() const = 0;   // pixels
  [[nodiscard]] virtual int Height() const = 0;  // pixels

  /// A file descriptor that is readable when TakeEvents() may have something.
  [[nodiscard]] virtual int Descriptor() const = 0;

  /// Shows the scene's top-level windows, each as a window of the display, and takes away those that are not in it. A
  /// foreground request that is new raises the windows, and gives the foreground window the keyboard when it lost it.
  virtual void Show(const Scene& scene) = 0;

  /// What has happened since the last call; never blocks. Exposed parts are drawn again on the way.
  virtual std::vector<ScreenEvent> TakeEvents() = 0;

  /// False once the display has gone away; nothing is shown and nothing comes in from then on.
  [[nodiscard]] virtual bool IsAlive() const = 0;
};

}  // namespace panelglow::platform::desktop
