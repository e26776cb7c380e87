// Windows on an X display. Each top-level window of a scene is a window of the display without a frame of its own
// (the window logic draws and moves it), so the screen looks the same with every window manager and with none.
#pragma once

#include <X11/Xlib.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "platform/desktop/Screen.h"
#include "platform/drawingmodule/CairoDrawing.h"

namespace panelglow::platform::desktop {

class X11Screen : public Screen {
 public:
  /// Null, with the reason in `error`, when the display that DISPLAY names does not open.
  static std::unique_ptr<X11Screen> Open(std::string& error);

  ~X11Screen() override;
  X11Screen(const X11Screen&) = delete;
  X11Screen& operator=(const X11Screen&) = delete;

  [[nodiscard]] int Width() const override;
  [[nodiscard]] int Height() const override;
  [[nodiscard]] int Descriptor() const override;
  void Show(const Scene& scene) override;
  std::vector<ScreenEvent> TakeEvents() override;
  [[nodiscard]] bool IsAlive() const override { return alive_; }

 private:
  struct ShownWindow {
    ::Window window = 0;
    Rectangle frame;
    Surface picture;  // what the window shows, for exposures
    Surface target;   // the window itself
  };

  explicit X11Screen(::Display* display);

  void Place(ShownWindow& shown, WindowHandle handle, const Rectangle& frame);
  void RemoveAllBut(const std::vector<WindowHandle>& windows);
  void FocusOn(WindowHandle foreground);
  void Draw(const Scene& scene, const std::map<WindowHandle, Rectangle>& damage);
  static void Paint(const ShownWindow& shown, const Rectangle& area);
  void TakeKey(XEvent& event, std::vector<ScreenEvent>& events);
  static int OnError(::Display* display, XErrorEvent* event);
  static void OnGone(::Display* display, void* screen);

  ::Display* display_;
  ::XIM inputMethod_ = nullptr;
  ::XIC inputContext_ = nullptr;
  ::Window inputWindow_ = 0;
  bool alive_ = true;
  std::map<WindowHandle, ShownWindow> windows_;
  std::vector<WindowHandle> order_;
  WindowHandle foreground_ = 0;  // of the windows that are shown
  Scene shown_;
  CairoDrawing drawing_;
};

}  // namespace panelglow::platform::desktop
