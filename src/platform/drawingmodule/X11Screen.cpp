#include "platform/drawingmodule/X11Screen.h"

#include <X11/Xutil.h>
#include <X11/keysym.h>
#include <cairo-xlib.h>

#include <algorithm>
#include <array>
#include <clocale>
#include <cstdlib>
#include <utility>

#include "platform/desktop/Damage.h"
#include "platform/desktop/WindowSystem.h"

namespace panelglow::platform::desktop {

namespace {

struct KeyRow {
  KeySym symbol;
  std::uint32_t virtualKey;  // of the home system
};

// Keys that stand for something else than the character they type.
constexpr std::array<KeyRow, 14> kKeys{{{XK_BackSpace, 0x08},
                                        {XK_Tab, 0x09},
                                        {XK_ISO_Left_Tab, WindowSystem::kShiftTabKey},
                                        {XK_Return, 0x0D},
                                        {XK_KP_Enter, 0x0D},
                                        {XK_Escape, 0x1B},
                                        {XK_space, 0x20},
                                        {XK_End, 0x23},
                                        {XK_Home, 0x24},
                                        {XK_Left, 0x25},
                                        {XK_Up, 0x26},
                                        {XK_Right, 0x27},
                                        {XK_Down, 0x28},
                                        {XK_Delete, 0x2E}}};

// Letters and digits have their upper-case character as code.
std::uint32_t VirtualKeyOf(KeySym symbol) {
  const auto* row = std::find_if(kKeys.begin(), kKeys.end(), [&](const KeyRow& key) { return key.symbol == symbol; });
  if (row != kKeys.end()) {
    return row->virtualKey;
  }
  if (symbol >= XK_a && symbol <= XK_z) {
    return static_cast<std::uint32_t>(symbol - XK_a + 'A');
  }
  return symbol < 0x80 ? static_cast<std::uint32_t>(symbol) : 0;
}

// The first character of a UTF-8 text as one UTF-16 unit, 0 for none and for those that need two.
char16_t FirstCharacter(const char* text, int length) {
  if (length <= 0) {
    return 0;
  }
  const auto byte = [&](int i) { return static_cast<unsigned>(static_cast<unsigned char>(text[i])); };
  if (byte(0) < 0x80) {
    return static_cast<char16_t>(byte(0));
  }
  if ((byte(0) & 0xE0U) == 0xC0 && length >= 2) {
    return static_cast<char16_t>((byte(0) & 0x1FU) << 6U | (byte(1) & 0x3FU));
  }
  if ((byte(0) & 0xF0U) == 0xE0 && length >= 3) {
    return static_cast<char16_t>((byte(0) & 0x0FU) << 12U | (byte(1) & 0x3FU) << 6U | (byte(2) & 0x3FU));
  }
  return 0;
}

}  // namespace

std::unique_ptr<X11Screen> X11Screen::Open(std::string& error) {
  const char* name = std::getenv("DISPLAY");
  if (name == nullptr || *name == '\0') {
    error = "the environment variable DISPLAY names no display";
    return nullptr;
  }
  ::Display* display = XOpenDisplay(name);
  if (display == nullptr) {
    error = "the display " + std::string(name) + " does not open";
    return nullptr;
  }
  return std::unique_ptr<X11Screen>(new X11Screen(display));
}

X11Screen::X11Screen(::Display* display) : display_(display) {
  XSetErrorHandler(OnError);
  XSetIOErrorExitHandler(display_, OnGone, this);
  XSetLocaleModifiers("");
  inputMethod_ = XOpenIM(display_, nullptr, nullptr, nullptr);
}

X11Screen::~X11Screen() {
  windows_.clear();
  if (alive_) {
    if (inputContext_ != nullptr) {
      XDestroyIC(inputContext_);
    }
    if (inputMethod_ != nullptr) {
      XCloseIM(inputMethod_);
    }
    XCloseDisplay(display_);
  }
}

// A window of ours may be gone by the time a request about it arrives: no reason to end.
int X11Screen::OnError(::Display* /*display*/, XErrorEvent* /*event*/) { return 0; }

void X11Screen::OnGone(::Display* /*display*/, void* screen) { static_cast<X11Screen*>(screen)->alive_ = false; }

int X11Screen::Width() const { return DisplayWidth(display_, DefaultScreen(display_)); }
int X11Screen::Height() const { return DisplayHeight(display_, DefaultScreen(display_)); }
int X11Screen::Descriptor() const { return ConnectionNumber(display_); }

void X11Screen::Place(ShownWindow& shown, WindowHandle handle, const Rectangle& frame) {
  const int width = std::max(1, frame.Width());
  const int height = std::max(1, frame.Height());
  const bool isNew = shown.window == 0;
  if (isNew) {
    XSetWindowAttributes attributes{};
    attributes.override_redirect = True;
    attributes.event_mask = ExposureMask | ButtonPressMask | ButtonReleaseMask | PointerMotionMask | KeyPressMask;
    shown.window = XCreateWindow(display_, DefaultRootWindow(display_), frame.left, frame.top,
                                 static_cast<unsigned>(width), static_cast<unsigned>(height), 0, CopyFromParent,
                                 InputOutput, CopyFromParent, CWOverrideRedirect | CWEventMask, &attributes);
    XStoreName(display_, shown.window, ("panelglow " + std::to_string(handle)).c_str());
    XMapRaised(display_, shown.window);
    shown.target.reset(cairo_xlib_surface_create(display_, shown.window,
                                                 DefaultVisual(display_, DefaultScreen(display_)), width, height));
  } else if (!(shown.frame == frame)) {
    XMoveResizeWindow(display_, shown.window, frame.left, frame.top, static_cast<unsigned>(width),
                      static_cast<unsigned>(height));
    cairo_xlib_surface_set_size(shown.target.get(), width, height);
  }
  if (isNew || shown.frame.Width() != frame.Width() || shown.frame.Height() != frame.Height()) {
    shown.picture.reset(cairo_image_surface_create(CAIRO_FORMAT_RGB24, width, height));
  }
  shown.frame = frame;
}

void X11Screen::RemoveAllBut(const std::vector<WindowHandle>& windows) {
  for (auto shown = windows_.begin(); shown != windows_.end();) {
    if (std::find(windows.begin(), windows.end(), shown->first) != windows.end()) {
      ++shown;
      continue;
    }
    if (inputContext_ != nullptr && inputWindow_ == shown->second.window) {
      XDestroyIC(std::exchange(inputContext_, nullptr));
    }
    shown->second.target.reset();
    XDestroyWindow(display_, shown->second.window);
    shown = windows_.erase(shown);
  }
}

void X11Screen::FocusOn(WindowHandle foreground) {
  const auto front = windows_.find(foreground);
  const WindowHandle before = std::exchange(foreground_, front == windows_.end() ? 0 : foreground);
  if (foreground_ == 0 || foreground_ == before) {
    return;
  }
  XSetInputFocus(display_, front->second.window, RevertToParent, CurrentTime);
  if (inputMethod_ != nullptr) {
    if (inputContext_ != nullptr) {
      XDestroyIC(inputContext_);
    }
    inputWindow_ = front->second.window;
    inputContext_ = XCreateIC(inputMethod_, XNInputStyle, XIMPreeditNothing | XIMStatusNothing, XNClientWindow,
                              inputWindow_, XNFocusWindow, inputWindow_, nullptr);
  }
}

void X11Screen::Show(const Scene& scene) {
  if (!alive_) {
    return;
  }
  const std::map<WindowHandle, Rectangle> damage = DamageBetween(shown_, scene);
  std::vector<WindowHandle> order;
  for (const SceneWindow& window : scene.windows) {
    if (window.topLevel == window.handle) {
      order.push_back(window.handle);
      Place(windows_[window.handle], window.handle, window.frame);
    }
  }
  RemoveAllBut(order);
  if (order != order_) {
    for (const WindowHandle handle : order) {
      XRaiseWindow(display_, windows_.at(handle).window);
    }
    order_ = order;
  }
  FocusOn(scene.foreground);  // before it is painted: whoever sees the window may type
  Draw(scene, damage);
  shown_ = scene;
  XFlush(display_);
}

void X11Screen::Draw(const Scene& scene, const std::map<WindowHandle, Rectangle>& damage) {
  for (const SceneWindow& window : scene.windows) {
    const auto damaged = damage.find(window.topLevel);
    if (damaged == damage.end() || Common(damaged->second, window.clip) == Rectangle{}) {
      continue;
    }
    const ShownWindow& shown = windows_.at(window.topLevel);
    const Rectangle& area = damaged->second;
    const Context context(cairo_create(shown.picture.get()));
    cairo_translate(context.get(), -shown.frame.left, -shown.frame.top);
    cairo_rectangle(context.get(), area.left, area.top, area.Width(), area.Height());
    cairo_clip(context.get());
    drawing_.DrawWindow(context.get(), window);
  }
  for (const auto& [handle, area] : damage) {
    const ShownWindow& shown = windows_.at(handle);
    Paint(shown, {area.left - shown.frame.left, area.top - shown.frame.top, area.right - shown.frame.left,
                  area.bottom - shown.frame.top});
  }
}

// Copies a part of the picture, in the window's pixels, onto the display.
void X11Screen::Paint(const ShownWindow& shown, const Rectangle& area) {
  const Context context(cairo_create(shown.target.get()));
  cairo_set_source_surface(context.get(), shown.picture.get(), 0, 0);
  cairo_rectangle(context.get(), area.left, area.top, area.Width(), area.Height());
  cairo_fill(context.get());
  cairo_surface_flush(shown.target.get());
}

std::vector<ScreenEvent> X11Screen::TakeEvents() {
  std::vector<ScreenEvent> events;
  while (alive_ && XPending(display_) > 0) {
    XEvent event{};
    XNextEvent(display_, &event);
    if (XFilterEvent(&event, 0) != 0) {
      continue;
    }
    const auto mouse = [&](ScreenEvent::Kind kind, int x, int y) {
      ScreenEvent taken;
      taken.kind = kind;
      taken.x = x;
      taken.y = y;
      events.push_back(taken);
    };
    switch (event.type) {
      case Expose:
        for (const auto& [handle, shown] : windows_) {
          if (shown.window == event.xexpose.window) {
            Paint(shown, {event.xexpose.x, event.xexpose.y, event.xexpose.x + event.xexpose.width,
                          event.xexpose.y + event.xexpose.height});
          }
        }
        break;
      case ButtonPress:
      case ButtonRelease:
        if (event.xbutton.button == Button1) {
          mouse(event.type == ButtonPress ? ScreenEvent::Kind::kMouseDown : ScreenEvent::Kind::kMouseUp,
                event.xbutton.x_root, event.xbutton.y_root);
        }
        break;
      case MotionNotify:
        if ((event.xmotion.state & Button1Mask) != 0) {
          mouse(ScreenEvent::Kind::kMouseMove, event.xmotion.x_root, event.xmotion.y_root);
        }
        break;
      case KeyPress:
        TakeKey(event, events);
        break;
      default:
        break;
    }
  }
  if (alive_) {
    XFlush(display_);
  }
  return events;
}

void X11Screen::TakeKey(XEvent& event, std::vector<ScreenEvent>& events) {
  std::array<char, 32> text{};
  KeySym symbol = NoSymbol;
  int length = 0;
  if (inputContext_ != nullptr) {
    Status status = 0;
    length =
        Xutf8LookupString(inputContext_, &event.xkey, text.data(), static_cast<int>(text.size()), &symbol, &status);
    if (status == XBufferOverflow) {
      return;
    }
  } else {
    length = XLookupString(&event.xkey, text.data(), static_cast<int>(text.size()), &symbol, nullptr);
  }
  ScreenEvent taken;
  taken.virtualKey = VirtualKeyOf(symbol);
  taken.character = FirstCharacter(text.data(), length);
  taken.alt = (event.xkey.state & Mod1Mask) != 0;
  if (taken.virtualKey != 0 || taken.character != 0) {
    events.push_back(taken);
  }
}

}  // namespace panelglow::platform::desktop
