#include "platform/drawingmodule/X11Picture.h"

#include <X11/Xutil.h>

#include <bit>

#include "platform/desktop/Damage.h"

namespace panelglow::platform::desktop {

namespace {

// How a picture's pixels lie in memory, so that the display takes them as they are.
cairo_format_t FormatOf(int depth) {
  switch (depth) {
    case 16:
      return CAIRO_FORMAT_RGB16_565;
    case 30:
      return CAIRO_FORMAT_RGB30;
    default:
      return CAIRO_FORMAT_RGB24;
  }
}

int DepthOf(::Display* display) { return DefaultDepth(display, DefaultScreen(display)); }

}  // namespace

Surface MakePicture(::Display* display, int width, int height) {
  return Surface(cairo_image_surface_create(FormatOf(DepthOf(display)), width, height));
}

void PutPicture(::Display* display, ::Window window, cairo_surface_t* picture, const Rectangle& area) {
  XImage image{};
  image.width = cairo_image_surface_get_width(picture);
  image.height = cairo_image_surface_get_height(picture);
  const Rectangle part = Common(area, {0, 0, image.width, image.height});
  if (part == Rectangle{}) {
    return;
  }
  cairo_surface_flush(picture);
  const Visual* visual = DefaultVisual(display, DefaultScreen(display));
  image.format = ZPixmap;
  image.data = reinterpret_cast<char*>(cairo_image_surface_get_data(picture));
  image.byte_order = std::endian::native == std::endian::little ? LSBFirst : MSBFirst;
  image.bitmap_unit = 32;
  image.bitmap_bit_order = image.byte_order;
  image.bitmap_pad = 32;
  image.depth = DepthOf(display);
  image.bytes_per_line = cairo_image_surface_get_stride(picture);
  image.bits_per_pixel = FormatOf(image.depth) == CAIRO_FORMAT_RGB16_565 ? 16 : 32;
  image.red_mask = visual->red_mask;
  image.green_mask = visual->green_mask;
  image.blue_mask = visual->blue_mask;
  if (XInitImage(&image) != 0) {
    XPutImage(display, window, DefaultGC(display, DefaultScreen(display)), &image, part.left, part.top, part.left,
              part.top, static_cast<unsigned>(part.Width()), static_cast<unsigned>(part.Height()));
  }
}

}  // namespace panelglow::platform::desktop
