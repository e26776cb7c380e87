#include "platform/drawingmodule/X11Keyboard.h"

#include <X11/XKBlib.h>
#include <X11/Xutil.h>
#include <X11/keysym.h>

#include <utility>

#include "platform/Text.h"
#include "platform/drawingmodule/X11Keys.h"

namespace panelglow::platform::desktop {

namespace {

constexpr std::size_t kUsualText = 32;  // bytes: of a key, and of most that input methods make

}  // namespace

void X11Keyboard::Open() {
  XkbSetDetectableAutoRepeat(display_, True, nullptr);  // a key that is held is pressed again, not released
  XSetLocaleModifiers("");
  inputMethod_ = XOpenIM(display_, nullptr, nullptr, nullptr);
}

void X11Keyboard::Close() {
  Forget(served_);
  if (inputMethod_ != nullptr) {
    XCloseIM(inputMethod_);
  }
}

void X11Keyboard::Serve(::Window window) {
  Forget(served_);
  if (inputMethod_ != nullptr) {
    served_ = window;
    inputContext_ = XCreateIC(inputMethod_, XNInputStyle, XIMPreeditNothing | XIMStatusNothing, XNClientWindow,
                              window, XNFocusWindow, window, nullptr);
  }
}

void X11Keyboard::Forget(::Window window) {
  if (inputContext_ != nullptr && served_ == window) {
    XDestroyIC(std::exchange(inputContext_, nullptr));
  }
}

void X11Keyboard::NoteKeysDown(const XKeymapEvent& keymap) {
  for (std::size_t code = 0; code < keysDown_.size(); ++code) {
    const auto byte = static_cast<unsigned>(static_cast<unsigned char>(keymap.key_vector[code / 8]));
    keysDown_.set(code, (byte >> code % 8 & 1U) != 0);
  }
}

std::optional<ScreenEvent> X11Keyboard::Take(XKeyEvent& event) {
  KeySym symbol = NoSymbol;
  const std::u16string text = WideFromUtf8(LookUp(event, symbol));
  ScreenEvent taken;
  taken.virtualKey = VirtualKeyOf(symbol);
  taken.alt = (event.state & Mod1Mask) != 0;
  taken.shift = (event.state & ShiftMask) != 0;
  const std::size_t code = event.keycode;
  const bool hasKey = code > 0 && code < keysDown_.size();  // a text that an input method made has none
  if (event.type == KeyRelease) {
    taken.kind = ScreenEvent::Kind::kKeyUp;
  } else if (text.size() > 1 || !hasKey) {
    taken.kind = ScreenEvent::Kind::kText;
    taken.text = text;
  } else {
    taken.repeat = keysDown_.test(code);
    taken.character = text.empty() ? u'\0' : text.front();
  }
  if (hasKey) {
    keysDown_.set(code, event.type == KeyPress);
  }
  const bool meansSomething = taken.virtualKey != 0 || taken.character != 0 || !taken.text.empty();
  return meansSomething ? std::optional<ScreenEvent>(std::move(taken)) : std::nullopt;
}

// What the key types, in UTF-8; nothing for a release.
std::string X11Keyboard::LookUp(XKeyEvent& event, KeySym& symbol) const {
  std::string text(kUsualText, '\0');
  int length = 0;
  if (event.type == KeyRelease || inputContext_ == nullptr) {
    length = XLookupString(&event, text.data(), static_cast<int>(text.size()), &symbol, nullptr);
    // Without an input method these are bytes of another code where they are no ASCII.
    const bool isText = event.type == KeyPress && length == 1 && static_cast<unsigned char>(text.front()) < 0x80;
    return text.substr(0, isText ? 1 : 0);
  }
  Status status = 0;
  const auto look = [&] {
    return Xutf8LookupString(inputContext_, &event, text.data(), static_cast<int>(text.size()), &symbol, &status);
  };
  length = look();
  if (status == XBufferOverflow) {
    text.resize(static_cast<std::size_t>(length));
    length = look();
  }
  return text.substr(0, status == XLookupChars || status == XLookupBoth ? static_cast<std::size_t>(length) : 0);
}

bool AsksForClipboard(XKeyEvent event) {
  const KeySym symbol = XLookupKeysym(&event, 0);  // as if no other key were down
  const bool control = (event.state & ControlMask) != 0;
  const bool shift = (event.state & ShiftMask) != 0;
  return event.type == KeyPress && ((control && symbol == XK_v) || (shift && symbol == XK_Insert));
}

}  // namespace panelglow::platform::desktop
