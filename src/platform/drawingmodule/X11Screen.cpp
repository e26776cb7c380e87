#include "platform/drawingmodule/X11Screen.h"

#include <X11/Xatom.h>
#include <X11/Xutil.h>
#include <X11/cursorfont.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <utility>

#include "platform/Text.h"
#include "platform/desktop/Damage.h"
#include "platform/drawingmodule/X11Picture.h"

namespace panelglow::platform::desktop {

namespace {

// The smallest rectangle of whole pixels of the display around an area of the scene.
Rectangle Scaled(const Rectangle& area, double scale) {
  const auto down = [&](int value) { return static_cast<int>(std::floor(value * scale)); };
  const auto up = [&](int value) { return static_cast<int>(std::ceil(value * scale)); };
  return {down(area.left), down(area.top), up(area.right), up(area.bottom)};
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

X11Screen::X11Screen(::Display* display)
    : display_(display),
      nameProperty_(XInternAtom(display, "_NET_WM_NAME", False)),
      utf8_(XInternAtom(display, "UTF8_STRING", False)),
      cursor_(XCreateFontCursor(display, XC_left_ptr)),
      keyboard_(display),
      clipboard_(display) {
  XSetErrorHandler(OnError);
  XSetIOErrorHandler(OnIoError);
  XSetIOErrorExitHandler(display_, OnGone, this);
  keyboard_.Open();
}

X11Screen::~X11Screen() {
  if (!alive_) {
    return;  // giving up what the display held would be requests to it
  }
  keyboard_.Close();
  XFreeCursor(display_, cursor_);
  XCloseDisplay(display_);
}

// A window of ours may be gone by the time a request about it arrives: no reason to end.
int X11Screen::OnError(::Display* /*display*/, XErrorEvent* /*event*/) { return 0; }

// Both instead of the library's own, which end the process: first this for any display, then OnGone for the one.
int X11Screen::OnIoError(::Display* /*display*/) { return 0; }

void X11Screen::OnGone(::Display* /*display*/, void* screen) { static_cast<X11Screen*>(screen)->alive_ = false; }

int X11Screen::Width() const { return DisplayWidth(display_, DefaultScreen(display_)); }
int X11Screen::Height() const { return DisplayHeight(display_, DefaultScreen(display_)); }
int X11Screen::Descriptor() const { return ConnectionNumber(display_); }

void X11Screen::Place(ShownWindow& shown, const SceneWindow& window) {
  const Rectangle frame = Scaled(window.frame, scale_);
  const int width = std::max(1, frame.Width());
  const int height = std::max(1, frame.Height());
  const bool isNew = shown.window == 0;
  if (isNew) {
    XSetWindowAttributes attributes{};
    attributes.override_redirect = True;
    attributes.cursor = cursor_;
    attributes.event_mask = ExposureMask | ButtonPressMask | ButtonReleaseMask | PointerMotionMask | KeyPressMask |
                            KeyReleaseMask | FocusChangeMask | KeymapStateMask | VisibilityChangeMask;
    shown.window =
        XCreateWindow(display_, DefaultRootWindow(display_), frame.left, frame.top, static_cast<unsigned>(width),
                      static_cast<unsigned>(height), 0, CopyFromParent, InputOutput, CopyFromParent,
                      CWOverrideRedirect | CWEventMask | CWCursor, &attributes);
    Name(shown, window.text);
    XMapRaised(display_, shown.window);
  } else if (!(shown.frame == frame)) {
    XMoveResizeWindow(display_, shown.window, frame.left, frame.top, static_cast<unsigned>(width),
                      static_cast<unsigned>(height));
  }
  if (isNew || shown.frame.Width() != frame.Width() || shown.frame.Height() != frame.Height()) {
    shown.picture = MakePicture(display_, width, height);
  }
  if (!isNew && shown.title != window.text) {
    Name(shown, window.text);
  }
  shown.frame = frame;
}

// What lists of windows, and other programs, call the window.
void X11Screen::Name(ShownWindow& shown, const std::u16string& title) {
  shown.title = title;
  const std::string name = title.empty() ? "panelglow-diags" : Utf8FromWide(title);
  const auto* bytes = reinterpret_cast<const unsigned char*>(name.data());
  for (const Atom property : {nameProperty_, Atom{XA_WM_NAME}}) {
    XChangeProperty(display_, shown.window, property, utf8_, 8, PropModeReplace, bytes,
                    static_cast<int>(name.size()));
  }
}

void X11Screen::RemoveAllBut(const std::vector<WindowHandle>& windows) {
  for (auto shown = windows_.begin(); shown != windows_.end();) {
    if (std::find(windows.begin(), windows.end(), shown->first) != windows.end()) {
      ++shown;
      continue;
    }
    keyboard_.Forget(shown->second.window);
    XDestroyWindow(display_, shown->second.window);
    shown = windows_.erase(shown);
  }
}

void X11Screen::BringForward(const Scene& scene) {
  const auto front = windows_.find(scene.foreground);
  const WindowHandle before = std::exchange(foreground_, front == windows_.end() ? 0 : scene.foreground);
  if (foreground_ == 0 || (foreground_ == before && request_ == scene.foregroundRequest)) {
    return;
  }
  request_ = scene.foregroundRequest;
  isLost_ = false;
  if (foreground_ == before) {
    RaiseAll();
    if (!hasFocus_) {
      FocusOn(front->second.window);
    }
    return;
  }
  FocusOn(front->second.window);
  isCovered_ = false;
  keyboard_.Serve(front->second.window);
}

void X11Screen::FocusOn(::Window window) {
  XSetInputFocus(display_, window, RevertToParent, CurrentTime);
  hasFocus_ = true;  // until the display says otherwise
}

void X11Screen::RaiseAll() {
  for (const WindowHandle handle : order_) {
    XRaiseWindow(display_, windows_.at(handle).window);
  }
}

// After each step the display may be gone, and must not be used any more.
void X11Screen::Show(const Scene& scene) {
  if (!alive_) {
    return;
  }
  if (scene.width > 0 && scene.height > 0) {
    // A screen larger than the display is shown smaller, so that every part of it can be seen.
    scale_ =
        std::min({1.0, Width() / static_cast<double>(scene.width), Height() / static_cast<double>(scene.height)});
  }
  const std::map<WindowHandle, Rectangle> damage = DamageBetween(shown_, scene);
  std::vector<WindowHandle> order;
  for (const SceneWindow& window : scene.windows) {
    if (alive_ && window.topLevel == window.handle) {
      order.push_back(window.handle);
      Place(windows_[window.handle], window);
    }
  }
  if (alive_) {
    RemoveAllBut(order);
  }
  if (alive_ && order != order_) {
    order_ = order;
    RaiseAll();
  }
  if (alive_) {
    BringForward(scene);  // before it is painted: whoever sees the window may type
  }
  if (alive_) {
    Draw(scene, damage);
  }
  shown_ = scene;
  if (alive_) {
    XFlush(display_);
  }
}

void X11Screen::Draw(const Scene& scene, const std::map<WindowHandle, Rectangle>& damage) {
  for (const SceneWindow& window : scene.windows) {
    const auto damaged = damage.find(window.topLevel);
    if (damaged == damage.end() || Common(damaged->second, window.clip) == Rectangle{}) {
      continue;
    }
    const ShownWindow& shown = windows_.at(window.topLevel);
    const Rectangle area = Scaled(damaged->second, scale_);
    const Context context(cairo_create(shown.picture.get()));
    cairo_translate(context.get(), -shown.frame.left, -shown.frame.top);
    cairo_rectangle(context.get(), area.left, area.top, area.Width(), area.Height());
    cairo_clip(context.get());
    cairo_scale(context.get(), scale_, scale_);
    drawing_.DrawWindow(context.get(), window, scene.language);
  }
  for (const auto& [handle, sceneArea] : damage) {
    if (!alive_) {
      return;
    }
    const ShownWindow& shown = windows_.at(handle);
    const Rectangle area = Scaled(sceneArea, scale_);
    PutPicture(display_, shown.window, shown.picture.get(),
               {area.left - shown.frame.left, area.top - shown.frame.top, area.right - shown.frame.left,
                area.bottom - shown.frame.top});
  }
}

std::vector<ScreenEvent> X11Screen::TakeEvents() {
  std::vector<ScreenEvent> events;
  while (alive_ && XPending(display_) > 0 && alive_) {
    XEvent event{};
    XNextEvent(display_, &event);
    if (alive_ && XFilterEvent(&event, 0) == 0) {
      TakeEvent(event, events);
    }
  }
  if (alive_) {
    NoteLoss(events);
  }
  if (alive_) {
    XFlush(display_);
  }
  return events;
}

void X11Screen::TakeEvent(XEvent& event, std::vector<ScreenEvent>& events) {
  const auto mouse = [&](ScreenEvent::Kind kind, int x, int y) {
    ScreenEvent taken;
    taken.kind = kind;
    taken.x = static_cast<int>(x / scale_);
    taken.y = static_cast<int>(y / scale_);
    events.push_back(std::move(taken));
  };
  const auto front = windows_.find(foreground_);
  const ::Window frontWindow = front == windows_.end() ? 0 : front->second.window;
  switch (event.type) {
    case Expose:
      for (const auto& [handle, shown] : windows_) {
        if (shown.window == event.xexpose.window) {
          PutPicture(display_, shown.window, shown.picture.get(),
                     {event.xexpose.x, event.xexpose.y, event.xexpose.x + event.xexpose.width,
                      event.xexpose.y + event.xexpose.height});
        }
      }
      break;
    case ButtonPress:
      if (frontWindow != 0) {
        FocusOn(event.xbutton.window);
      }
      [[fallthrough]];
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
    case KeyRelease:
      if (IsRepeated(event)) {
        break;  // the press that follows is marked as a repeated one
      }
      [[fallthrough]];
    case KeyPress:
      TakeKey(event.xkey, events);
      break;
    case SelectionNotify: {
      ScreenEvent pasted;
      pasted.kind = ScreenEvent::Kind::kText;
      pasted.text = clipboard_.TextOf(event.xselection);
      if (!pasted.text.empty()) {
        events.push_back(std::move(pasted));
      }
      break;
    }
    case KeymapNotify:  // follows each focus: keys that were pressed or released elsewhere
      keyboard_.NoteKeysDown(event.xkeymap);
      break;
    case FocusIn:
    case FocusOut: {
      const XFocusChangeEvent& focus = event.xfocus;
      const bool isGrab = focus.mode == NotifyGrab || focus.mode == NotifyUngrab;
      if (focus.window == frontWindow && !isGrab && focus.detail != NotifyPointer && focus.detail != NotifyInferior) {
        hasFocus_ = event.type == FocusIn;
      }
      break;
    }
    case VisibilityNotify:
      if (event.xvisibility.window == frontWindow) {
        isCovered_ = event.xvisibility.state != VisibilityUnobscured && !IsUnderOwnWindow();
      }
      break;
    default:
      break;
  }
}

// True when a window of ours lies on the foreground one.
bool X11Screen::IsUnderOwnWindow() const {
  const auto place = std::find(order_.begin(), order_.end(), foreground_);
  return place != order_.end() && std::any_of(place + 1, order_.end(), [&](WindowHandle above) {
           return !(Common(windows_.at(above).frame, windows_.at(foreground_).frame) == Rectangle{});
         });
}

// Says once that the foreground is another program's now: until it is asked for again.
void X11Screen::NoteLoss(std::vector<ScreenEvent>& events) {
  isLost_ = isLost_ && (!hasFocus_ || isCovered_);  // it may come back by itself
  if (foreground_ == 0 || isLost_ || (hasFocus_ && !isCovered_)) {
    return;
  }
  ::Window focused = windows_.at(foreground_).window;
  if (!hasFocus_) {
    int revertTo = 0;
    XGetInputFocus(display_, &focused, &revertTo);
    hasFocus_ = focused == windows_.at(foreground_).window;  // when the loss is an old story
    if (hasFocus_ && !isCovered_) {
      return;
    }
  }
  ScreenEvent lost;
  lost.kind = ScreenEvent::Kind::kForegroundLost;
  lost.title = hasFocus_ ? std::u16string() : TitleOf(focused);
  events.push_back(std::move(lost));
  isLost_ = true;
  isCovered_ = false;
}

// The title of a window, or of the nearest one around it that has one.
std::u16string X11Screen::TitleOf(::Window window) const {
  constexpr long kLongestTitle = 1024;  // in units of four bytes
  constexpr int kMostLevels = 16;
  for (int level = 0; alive_ && level < kMostLevels && window > PointerRoot; ++level) {
    for (const Atom property : {nameProperty_, Atom{XA_WM_NAME}}) {
      Atom type = 0;
      int format = 0;
      unsigned long length = 0;
      unsigned long left = 0;
      unsigned char* bytes = nullptr;
      const int failed = XGetWindowProperty(display_, window, property, 0, kLongestTitle, False, AnyPropertyType,
                                            &type, &format, &length, &left, &bytes);
      std::u16string title;
      if (failed == 0 && bytes != nullptr && format == 8) {
        title = WideFromUtf8({reinterpret_cast<const char*>(bytes), length});
      }
      if (bytes != nullptr) {
        XFree(bytes);
      }
      if (!title.empty()) {
        return title;
      }
    }
    ::Window root = 0;
    ::Window parent = 0;
    ::Window* children = nullptr;
    unsigned count = 0;
    const bool known = XQueryTree(display_, window, &root, &parent, &children, &count) != 0;
    if (children != nullptr) {
      XFree(children);
    }
    window = known && parent != root ? parent : 0;
  }
  return {};
}

// A display that cannot do without releases between the presses of a held key gives both the same time.
bool X11Screen::IsRepeated(const XEvent& release) const {
  if (XEventsQueued(display_, QueuedAfterReading) == 0 || !alive_) {
    return false;
  }
  XEvent next{};
  XPeekEvent(display_, &next);
  return next.type == KeyPress && next.xkey.keycode == release.xkey.keycode && next.xkey.time == release.xkey.time;
}

void X11Screen::TakeKey(XKeyEvent& event, std::vector<ScreenEvent>& events) {
  if (AsksForClipboard(event)) {
    clipboard_.Ask(event.window, event.time);
  } else if (std::optional<ScreenEvent> taken = keyboard_.Take(event)) {
    events.push_back(std::move(*taken));
  }
}

}  // namespace panelglow::platform::desktop
