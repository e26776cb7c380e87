// The built-in controls: buttons, scroll bars and entry fields.
#include <algorithm>
#include <optional>
#include <utility>

#include "platform/desktop/Keys.h"
#include "platform/desktop/ScrollParts.h"
#include "platform/desktop/WindowRecords.h"

namespace panelglow::platform::desktop {

namespace {

constexpr std::size_t kLimitEditCharacters = 30000;
constexpr std::uint32_t kRepeatTimer = 1;  // of a scroll bar

int XOf(const Message& message) { return static_cast<std::int16_t>(message.lParam & 0xFFFF); }
int YOf(const Message& message) { return static_cast<std::int16_t>(message.lParam >> 16 & 0xFFFF); }

bool IsVertical(std::uint32_t barStyle) { return (barStyle & style::kScrollBarVertical) != 0; }

// A control's frame in its own coordinates.
Rectangle OwnFrame(const Rectangle& area) { return {0, 0, area.Width(), area.Height()}; }

// What a press on a part of a scroll bar asks for; nothing on the thumb and beside the bar.
std::optional<std::uint32_t> RequestAt(const ScrollParts& parts, bool vertical, int x, int y) {
  if (parts.backArrow.Contains(x, y)) {
    return scroll::kLineBack;
  }
  if (parts.forwardArrow.Contains(x, y)) {
    return scroll::kLineForward;
  }
  if (!parts.track.Contains(x, y) || parts.thumb.Contains(x, y)) {
    return std::nullopt;
  }
  const bool back = vertical ? y < parts.thumb.top : x < parts.thumb.left;
  return back ? scroll::kPageBack : scroll::kPageForward;
}

// The places before and behind the character at a place; a character may be a pair of units.
bool IsPairAt(std::u16string_view text, std::size_t at) {
  return at + 1 < text.size() && (text[at] & 0xFC00) == 0xD800 && (text[at + 1] & 0xFC00) == 0xDC00;
}
std::size_t StepBack(std::u16string_view text, std::size_t at) {
  return at >= 2 && IsPairAt(text, at - 2) ? at - 2 : at - std::min<std::size_t>(at, 1);
}
std::size_t StepOn(std::u16string_view text, std::size_t at) {
  return std::min(text.size(), at + (IsPairAt(text, at) ? 2 : 1));
}

}  // namespace

void WindowSystem::PressButton(WindowHandle button) {
  const Window* window = Find(button);
  if (window == nullptr || !window->enabled) {
    return;
  }
  Send({window->parent, message::kCommand, static_cast<std::uintptr_t>(window->id) & 0xFFFFU,
        static_cast<std::intptr_t>(button)});
}

// A control's mouse coordinates are those of its frame.
void WindowSystem::OnControlDown(WindowHandle control, int x, int y) {
  Window* window = Find(control);
  if (window->kind == WindowKind::kScrollBar) {
    OnScrollBarDown(control, x, y);
    return;
  }
  SetFocus(control);
  window = Find(control);
  if (window != nullptr && window->kind == WindowKind::kButton) {
    window->mouseHeld = true;
    window->pressed = true;
    Changed();
  }
}

void WindowSystem::OnScrollBarDown(WindowHandle bar, int x, int y) {
  constexpr std::uint32_t kBeforeRepeat_ms = 300;
  Window* window = Find(bar);
  const bool vertical = IsVertical(window->style);
  const ScrollParts parts = PartsOfScrollBar(OwnFrame(window->area), vertical, window->scroll);
  dragX_ = x;
  dragY_ = y;
  if (parts.thumb.Contains(x, y)) {
    window->pressed = true;
    dragX_ -= parts.thumb.left;
    dragY_ -= parts.thumb.top;
    return;
  }
  window->heldRequest = RequestAt(parts, vertical, x, y);
  if (window->heldRequest) {
    RepeatScroll(bar, kBeforeRepeat_ms);
    SendScroll(bar, *window->heldRequest, 0);
  }
}

// What is held asks again, as long as the mouse is still on the same part.
void WindowSystem::RepeatScroll(WindowHandle bar, std::uint32_t delay_ms) {
  constexpr std::uint32_t kBetweenRepeats_ms = 50;
  SetTimer(bar, kRepeatTimer, delay_ms, [this](WindowHandle held, std::uint32_t /*timer*/) {
    host_.RunInside([&] {
      const Window* window = Find(held);
      if (window == nullptr || !window->heldRequest) {
        return;
      }
      RepeatScroll(held, kBetweenRepeats_ms);
      const bool vertical = IsVertical(window->style);
      const ScrollParts parts = PartsOfScrollBar(OwnFrame(window->area), vertical, window->scroll);
      if (RequestAt(parts, vertical, dragX_, dragY_) == window->heldRequest) {
        SendScroll(held, *window->heldRequest, 0);
      }
    });
  });
}

void WindowSystem::OnControlMove(WindowHandle control, int x, int y) {
  Window* window = Find(control);
  if (window->kind == WindowKind::kButton) {
    const bool inside = OwnFrame(window->area).Contains(x, y);
    if (window->mouseHeld && inside != window->pressed) {
      window->pressed = inside;
      Changed();
    }
  } else if (window->heldRequest) {
    dragX_ = x;
    dragY_ = y;
  } else if (window->kind == WindowKind::kScrollBar && window->pressed) {
    const bool vertical = IsVertical(window->style);
    const ScrollParts parts = PartsOfScrollBar(OwnFrame(window->area), vertical, window->scroll);
    const int along = vertical ? y - dragY_ - parts.track.top : x - dragX_ - parts.track.left;
    const int position =
        window->scroll.minimum + static_cast<int>(static_cast<long long>(std::clamp(along, 0, parts.travel)) *
                                                  parts.distance / std::max(1, parts.travel));
    SendScroll(control, scroll::kThumbTrack, position);
  }
}

// A press counts when the release is over the button that was pressed, wherever the mouse was in between.
void WindowSystem::OnControlUp(WindowHandle control, int x, int y) {
  Window* window = Find(control);
  const bool dragged = std::exchange(window->pressed, false);
  const bool asked = std::exchange(window->heldRequest, std::nullopt).has_value();
  Changed();
  if (window->kind == WindowKind::kButton) {
    if (std::exchange(window->mouseHeld, false) && OwnFrame(window->area).Contains(x, y)) {
      PressButton(control);
    }
    return;
  }
  if (dragged) {
    SendScroll(control, scroll::kThumbPosition, window->scroll.position);
  }
  if (asked || dragged) {
    KillTimer(control, kRepeatTimer);
    SendScroll(control, scroll::kReleased, 0);
  }
}

// Space presses a button when it is released: held, it presses it once. A key that was already held when the button
// got the focus is not a press of this button.
void WindowSystem::OnButtonKey(WindowHandle button, const Message& message) {
  Window* window = Find(button);
  if (message.wParam != key::kSpace) {
    return;
  }
  if (message.id == message::kKeyUp) {
    const bool held = std::exchange(window->spaceHeld, false);
    window->pressed = window->pressed && !held;
    Changed();
    if (held) {
      PressButton(button);
    }
  } else if ((message.lParam & key_data::kWasDown) == 0) {
    window->spaceHeld = true;
    window->pressed = true;
    Changed();
  }
}

void WindowSystem::OnEditKey(WindowHandle edit, std::uintptr_t virtualKey) {
  Window* window = Find(edit);
  switch (virtualKey) {
    case key::kLeft:
      window->caret = StepBack(window->text, window->caret);
      break;
    case key::kRight:
      window->caret = StepOn(window->text, window->caret);
      break;
    case key::kHome:
      window->caret = 0;
      break;
    case key::kEnd:
      window->caret = window->text.size();
      break;
    case key::kDelete:
      window->text.erase(window->caret, StepOn(window->text, window->caret) - window->caret);
      break;
    default:
      return;
  }
  Changed();
}

void WindowSystem::OnEditCharacter(WindowHandle edit, char16_t character) {
  Window* window = Find(edit);
  if (character == key::kBackspace) {
    const std::size_t before = StepBack(window->text, window->caret);
    window->text.erase(before, window->caret - before);
    window->caret = before;
  } else if (character >= u' ' && window->text.size() < kLimitEditCharacters) {
    window->text.insert(window->caret++, 1, character);
  }
  Changed();
}

void WindowSystem::SendScroll(WindowHandle bar, std::uint32_t request, int position) {
  const Window* window = Find(bar);
  const bool vertical = IsVertical(window->style);
  Send({window->parent, vertical ? message::kVerticalScroll : message::kHorizontalScroll,
        (static_cast<std::uint32_t>(position) & 0xFFFFU) << 16U | request, static_cast<std::intptr_t>(bar)});
}

std::intptr_t WindowSystem::ControlProcedure(const Message& message) {
  Window* window = Find(message.window);
  if (window == nullptr) {
    return 0;
  }
  switch (message.id) {
    case message::kLeftButtonDown:
      OnControlDown(message.window, XOf(message), YOf(message));
      return 0;
    case message::kMouseMove:
      OnControlMove(message.window, XOf(message), YOf(message));
      return 0;
    case message::kLeftButtonUp:
      OnControlUp(message.window, XOf(message), YOf(message));
      return 0;
    case message::kKillFocus:
    case message::kSysKeyUp:  // a Space that is released with Alt is none
      if (std::exchange(window->spaceHeld, false)) {
        window->pressed = false;
        Changed();
      }
      return 0;
    case message::kKeyDown:
    case message::kKeyUp:
      if (window->kind == WindowKind::kButton) {
        OnButtonKey(message.window, message);
      } else if (window->kind == WindowKind::kEdit && message.id == message::kKeyDown) {
        OnEditKey(message.window, message.wParam);
      }
      return 0;
    case message::kChar:
      if (window->kind == WindowKind::kEdit) {
        OnEditCharacter(message.window, static_cast<char16_t>(message.wParam));
      }
      return 0;
    default:
      return 0;
  }
}

}  // namespace panelglow::platform::desktop
