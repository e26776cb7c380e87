// Pictures in the display's own form of pixels, and their way onto it.
#pragma once

#include <X11/Xlib.h>

#include "platform/Desktop.h"
#include "platform/drawingmodule/CairoDrawing.h"

namespace panelglow::platform::desktop {

/// A picture to draw into, of a size in pixels.
Surface MakePicture(::Display* display, int width, int height);

/// Copies an area of such a picture to the same place in a window.
///
/// By the library's plainest request: what waits for the display's answers meanwhile, as pictures in shared memory
/// do, waits for ever when the display dies.
void PutPicture(::Display* display, ::Window window, cairo_surface_t* picture, const Rectangle& area);

}  // namespace panelglow::platform::desktop
