// What the program asks of the drawing module, which is loaded when the first picture or window is wanted.
#include <string>

#include "platform/drawingmodule/CairoDrawing.h"
#include "platform/drawingmodule/X11Screen.h"

namespace {

panelglow::platform::desktop::CairoDrawing& TheDrawing() {
  static panelglow::platform::desktop::CairoDrawing drawing;
  return drawing;
}

}  // namespace

extern "C" panelglow::platform::desktop::SceneDrawing* PanelglowSceneDrawing() { return &TheDrawing(); }

/// A screen on the X display that DISPLAY names, owned by the caller; null, with the reason in `error`, when there is
/// none. It draws with a drawing of its own, so that it may be used from another thread.
extern "C" panelglow::platform::desktop::Screen* PanelglowOpenScreen(std::string* error) {
  return panelglow::platform::desktop::X11Screen::Open(*error).release();
}
