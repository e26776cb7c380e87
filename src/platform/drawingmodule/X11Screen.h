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
#include "platform/drawingmodule/X11Clipboard.h"
#include "platform/drawingmodule/X11Keyboard.h"

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
    Rectangle frame;  // pixels of the display
    std::u16string title;
    Surface picture;  // what the window shows, for exposures
  };

  explicit X11Screen(::Display* display);

  void Place(ShownWindow& shown, const SceneWindow& window);
  void Name(ShownWindow& shown, const std::u16string& title);
  void RemoveAllBut(const std::vector<WindowHandle>& windows);
  void BringForward(const Scene& scene);
  void FocusOn(::Window window);
  void RaiseAll();
  void Draw(const Scene& scene, const std::map<WindowHandle, Rectangle>& damage);
  void TakeEvent(XEvent& event, std::vector<ScreenEvent>& events);
  [[nodiscard]] bool IsRepeated(const XEvent& release) const;
  void TakeKey(XKeyEvent& event, std::vector<ScreenEvent>& events);
  void NoteLoss(std::vector<ScreenEvent>& events);
  [[nodiscard]] bool IsUnderOwnWindow() const;
  [[nodiscard]] std::u16string TitleOf(::Window window) const;
  static int OnError(::Display* display, XErrorEvent* event);
  static int OnIoError(::Display* display);
  static void OnGone(::Display* display, void* screen);

  ::Display* display_;
  Atom nameProperty_;
  Atom utf8_;
  Cursor cursor_;
  X11Keyboard keyboard_;
  X11Clipboard clipboard_;
  bool alive_ = true;
  std::map<WindowHandle, ShownWindow> windows_;
  std::vector<WindowHandle> order_;
  double scale_ = 1;             // pixels of the display for one of the scene
  WindowHandle foreground_ = 0;  // of the windows that are shown
  std::uint64_t request_ = 0;    // for the foreground, that was followed last
  bool hasFocus_ = false;        // the foreground window has the keyboard
  bool isCovered_ = false;       // a window of another program lies on it
  bool isLost_ = false;          // one of the two was told
  Scene shown_;
  CairoDrawing drawing_;
};

}  // namespace panelglow::platform::desktop
