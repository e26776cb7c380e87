#include "platform/drawingmodule/X11Clipboard.h"

#include "platform/Text.h"

namespace panelglow::platform::desktop {

X11Clipboard::X11Clipboard(::Display* display)
    : display_(display),
      clipboard_(XInternAtom(display, "CLIPBOARD", False)),
      utf8_(XInternAtom(display, "UTF8_STRING", False)),
      property_(XInternAtom(display, "PANELGLOW_CLIPBOARD", False)) {}

void X11Clipboard::Ask(::Window window, ::Time time) const {
  XConvertSelection(display_, clipboard_, utf8_, property_, window, time);
}

std::u16string X11Clipboard::TextOf(const XSelectionEvent& answer) const {
  constexpr long kLongest = 30'000;  // in units of four bytes
  if (answer.selection != clipboard_ || answer.property != property_) {
    return {};
  }
  Atom type = 0;
  int format = 0;
  unsigned long length = 0;
  unsigned long left = 0;
  unsigned char* bytes = nullptr;
  const int failed = XGetWindowProperty(display_, answer.requestor, property_, 0, kLongest, True, utf8_, &type,
                                        &format, &length, &left, &bytes);
  std::u16string text;
  if (failed == 0 && bytes != nullptr && type == utf8_ && format == 8 && left == 0) {
    text = WideFromUtf8({reinterpret_cast<const char*>(bytes), length});
  }
  if (bytes != nullptr) {
    XFree(bytes);
  }
  return text;
}

}  // namespace panelglow::platform::desktop
