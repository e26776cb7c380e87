// The text that another program has put into the display's clipboard.
#pragma once

#include <X11/Xlib.h>

#include <string>

namespace panelglow::platform::desktop {

class X11Clipboard {
 public:
  explicit X11Clipboard(::Display* display);

  /// Asks whoever has the clipboard for its text. The answer comes as an event to `window`, or never.
  void Ask(::Window window, ::Time time) const;

  /// The text of that answer. Empty when there is none, and for one of more characters than a line can have.
  [[nodiscard]] std::u16string TextOf(const XSelectionEvent& answer) const;

 private:
  ::Display* display_;
  Atom clipboard_;
  Atom utf8_;
  Atom property_;  // of our window: where the answer is put
};

}  // namespace panelglow::platform::desktop
