#include "platform/desktop/DialogKeys.h"

#include <algorithm>
#include <vector>

#include "platform/desktop/Keys.h"

namespace panelglow::platform::desktop {

namespace {

bool IsUsable(const Window& window) { return window.enabled && window.visible; }
bool IsTabStop(const Window& window) { return (window.style & style::kTabStop) != 0 && IsUsable(window); }
bool IsUsableButton(const Window& window) { return window.kind == WindowKind::kButton && IsUsable(window); }

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

// The next child in the order of creation, after the last one the first, that is `wanted`. From a window that is no
// child the walk begins outside.
template <class Wanted>
WindowHandle Walk(const WindowTree& tree, WindowHandle dialog, WindowHandle from, bool backwards, Wanted wanted) {
  std::vector<WindowHandle> children = tree.Find(dialog)->children;
  if (backwards) {
    std::reverse(children.begin(), children.end());
  }
  const auto current = std::find(children.begin(), children.end(), from);
  if (current != children.end()) {
    std::rotate(children.begin(), current + 1, children.end());
  }
  const auto next =
      std::find_if(children.begin(), children.end(), [&](WindowHandle child) { return wanted(*tree.Find(child)); });
  return next == children.end() ? 0 : *next;
}

WindowHandle ButtonWithMnemonic(const WindowTree& tree, WindowHandle dialog, char16_t letter) {
  return Walk(tree, dialog, 0, false, [&](const Window& window) {
    return letter != 0 && IsUsableButton(window) && MnemonicOf(TextOf(window)) == UpperLetter(letter);
  });
}

std::optional<DialogAction> ActionOfKey(const WindowTree& tree, WindowHandle dialog, WindowHandle focus,
                                        const Message& message) {
  const Window* focused = tree.Find(focus);
  const bool onButton = focused != nullptr && focused->kind == WindowKind::kButton;
  DialogAction action;
  switch (message.wParam) {
    case key::kTab:
      action.focus = Walk(tree, dialog, focus, (message.lParam & key_data::kShift) != 0, IsTabStop);
      return action;
    case key::kLeft:
    case key::kUp:
    case key::kRight:
    case key::kDown: {
      const bool backwards = message.wParam == key::kLeft || message.wParam == key::kUp;
      if (!onButton) {
        return std::nullopt;
      }
      if (focused->parent == dialog) {
        action.focus = Walk(tree, dialog, focus, backwards, IsUsableButton);
      }
      return action;
    }
    case key::kEnter:
      action.press = onButton && tree.IsDescendant(dialog, focus) ? focus : 0;
      action.pressDefault = action.press == 0;
      return action;
    case key::kEscape:
      action.command = kCancelCommand;
      return action;
    default:
      return std::nullopt;
  }
}

}  // namespace

std::optional<DialogAction> ActionOf(const WindowTree& tree, WindowHandle dialog, WindowHandle focus,
                                     const Message& message) {
  if (message.id == message::kKeyDown) {
    return ActionOfKey(tree, dialog, focus, message);
  }
  // A letter alone presses a button where nothing is typed. One that is held presses once, and what no key typed
  // never does.
  const bool isTyped = message.id == message::kSysChar ||
                       (message.id == message::kChar && tree.Find(message.window)->kind != WindowKind::kEdit);
  if (!isTyped || (message.lParam & (key_data::kWasDown | key_data::kNoKey)) != 0) {
    return std::nullopt;
  }
  const WindowHandle button = ButtonWithMnemonic(tree, dialog, static_cast<char16_t>(message.wParam));
  if (button == 0) {
    return std::nullopt;
  }
  DialogAction action;
  action.focus = button;
  action.press = button;
  return action;
}

WindowHandle DefaultButton(const WindowTree& tree, WindowHandle dialog) {
  return Walk(tree, dialog, 0, false, [](const Window& window) {
    return window.kind == WindowKind::kButton && (window.style & 0xFU) == style::kDefaultPushButton;
  });
}

}  // namespace panelglow::platform::desktop
