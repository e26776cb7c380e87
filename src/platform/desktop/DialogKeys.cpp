// The keyboard rules of a dialog.
#include <algorithm>

#include "platform/desktop/Keys.h"
#include "platform/desktop/WindowRecords.h"

namespace panelglow::platform::desktop {

namespace {

// Commands that a dialog gets for Enter without a default button, and for Escape.
constexpr std::uintptr_t kOkCommand = 1;
constexpr std::uintptr_t kCancelCommand = 2;

char16_t UpperLetter(char16_t c) { return c >= u'a' && c <= u'z' ? static_cast<char16_t>(c - 32) : c; }

// The letter behind the first single '&' of a caption, 0 when there is none. A blank is none: Space is the focused
// button's, and Alt with it no button's.
char16_t MnemonicOf(std::u16string_view caption) {
  for (std::size_t i = 0; i + 1 < caption.size(); ++i) {
    if (caption[i] == u'&') {
      if (caption[i + 1] != u'&') {
        return caption[i + 1] == u' ' ? u'\0' : UpperLetter(caption[i + 1]);
      }
      ++i;
    }
  }
  return 0;
}

}  // namespace

void WindowSystem::FocusNext(WindowHandle dialog, bool backwards) {
  std::vector<WindowHandle> stops;
  for (const WindowHandle child : Find(dialog)->children) {
    const Window* window = Find(child);
    if ((window->style & style::kTabStop) != 0 && window->enabled && window->visible) {
      stops.push_back(child);
    }
  }
  if (stops.empty()) {
    return;
  }
  const auto current = std::find(stops.begin(), stops.end(), OwnQueue().focus);
  std::size_t next = backwards ? stops.size() - 1 : 0;
  if (current != stops.end()) {
    const auto at = static_cast<std::size_t>(current - stops.begin());
    next = (at + (backwards ? stops.size() - 1 : 1)) % stops.size();
  }
  SetFocus(stops[next]);
}

void WindowSystem::FocusInGroup(WindowHandle dialog, bool backwards) {
  const std::vector<WindowHandle>& children = Find(dialog)->children;
  const auto current = std::find(children.begin(), children.end(), OwnQueue().focus);
  if (current == children.end()) {
    return;
  }
  const auto count = children.size();
  auto at = static_cast<std::size_t>(current - children.begin());
  for (std::size_t step = 0; step < count; ++step) {
    at = (at + (backwards ? count - 1 : 1)) % count;
    const Window* window = Find(children[at]);
    if (window->kind == WindowKind::kButton && window->enabled && window->visible) {
      SetFocus(window->handle);
      return;
    }
  }
}

WindowHandle WindowSystem::DefaultButton(WindowHandle dialog) const {
  for (const WindowHandle child : Find(dialog)->children) {
    const Window* window = Find(child);
    if (window->kind == WindowKind::kButton && (window->style & 0xFU) == style::kDefaultPushButton) {
      return child;
    }
  }
  return 0;
}

bool WindowSystem::PressMnemonic(WindowHandle dialog, char16_t letter) {
  for (const WindowHandle child : std::vector<WindowHandle>(Find(dialog)->children)) {
    const Window* window = Find(child);
    if (window->kind == WindowKind::kButton && window->enabled && window->visible &&
        MnemonicOf(window->text) == UpperLetter(letter) && letter != 0) {
      SetFocus(child);
      PressButton(child);
      return true;
    }
  }
  return false;
}

bool WindowSystem::IsDialogMessage(WindowHandle dialog, const Message& message) {
  if (Find(dialog) == nullptr || !IsDescendant(dialog, message.window)) {
    return false;
  }
  if (message.id == message::kKeyDown) {
    const WindowHandle focus = OwnQueue().focus;
    const Window* focused = Find(focus);
    switch (message.wParam) {
      case key::kTab:
      case key::kShiftTab:
        FocusNext(dialog, message.wParam == key::kShiftTab);
        return true;
      case key::kLeft:
      case key::kUp:
      case key::kRight:
      case key::kDown:
        if (focused != nullptr && focused->kind == WindowKind::kButton) {
          FocusInGroup(dialog, message.wParam == key::kLeft || message.wParam == key::kUp);
          return true;
        }
        break;
      case key::kEnter:
        if (focused != nullptr && focused->kind == WindowKind::kButton && IsDescendant(dialog, focus)) {
          PressButton(focus);
        } else {
          const std::intptr_t answer = Send({dialog, message::kGetDefaultId, 0, 0});
          const WindowHandle button = FindControl(dialog, static_cast<int>(answer & 0xFFFF));
          if ((answer & ~std::intptr_t{0xFFFF}) == kHasDefaultId && button != 0) {
            PressButton(button);
          } else {
            Send({dialog, message::kCommand, kOkCommand, 0});
          }
        }
        return true;
      case key::kEscape:
        Send({dialog, message::kCommand, kCancelCommand, 0});
        return true;
      default:
        break;
    }
  }
  // A letter alone does where nothing is typed. One that is held presses once.
  const Window* typedInto = Find(message.window);
  const bool mayPress =
      message.id == message::kSysChar || (message.id == message::kChar && typedInto->kind != WindowKind::kEdit);
  if (mayPress && (message.lParam & key_data::kWasDown) == 0 &&
      PressMnemonic(dialog, static_cast<char16_t>(message.wParam))) {
    return true;
  }
  Translate(message);
  Dispatch(message);
  return true;
}

}  // namespace panelglow::platform::desktop
