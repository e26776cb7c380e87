// The keys of an X display: what is typed, also through an input method, and which keys are held.
#pragma once

#include <X11/Xlib.h>

#include <bitset>
#include <optional>
#include <string>

#include "platform/desktop/Screen.h"

namespace panelglow::platform::desktop {

class X11Keyboard {
 public:
  explicit X11Keyboard(::Display* display) : display_(display) {}

  /// Asks the display for what is needed, once.
  void Open();

  /// Gives up what the display holds for it. Not to be called once the display has gone away.
  void Close();

  /// The input method works for this window from now on.
  void Serve(::Window window);

  /// The window is about to be destroyed.
  void Forget(::Window window);

  /// Keys that were pressed or released elsewhere.
  void NoteKeysDown(const XKeymapEvent& keymap);

  /// A key that was pressed or released, or what an input method made of keys. Nothing for a key that means nothing
  /// here.
  std::optional<ScreenEvent> Take(XKeyEvent& event);

 private:
  [[nodiscard]] std::string LookUp(XKeyEvent& event, KeySym& symbol) const;

  ::Display* display_;
  ::XIM inputMethod_ = nullptr;
  ::XIC inputContext_ = nullptr;
  ::Window served_ = 0;
  std::bitset<256> keysDown_;  // by key code
};

/// True for the keys that ask for the clipboard's text.
bool AsksForClipboard(XKeyEvent event);

}  // namespace panelglow::platform::desktop
