#include "platform/desktop/EditControl.h"

#include <algorithm>

#include "platform/desktop/Keys.h"

namespace panelglow::platform::desktop {

namespace {

constexpr std::size_t kMostCharacters = 30000;
constexpr char16_t kRubOut = 0x7F;  // what some displays type with Delete

// The places in front of and behind the character at a place; a character may be a pair of units.
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

std::size_t EditControl::SelectionBegin() const { return std::min(caret_, anchor_); }
std::size_t EditControl::SelectionEnd() const { return std::max(caret_, anchor_); }

void EditControl::SetText(std::u16string_view text) {
  text_ = text;
  MoveTo(0, false);
}

ControlEffects EditControl::Handle(const Message& message) {
  ControlEffects effects;
  switch (message.id) {
    case message::kLeftButtonDown:
      effects.takesFocus = true;
      break;
    case message::kKeyDown:
      effects.changed = OnKey(message);
      break;
    case message::kChar:
      OnCharacter(static_cast<char16_t>(message.wParam));
      effects.changed = true;
      break;
    case message::kSelectAll:
      anchor_ = 0;
      caret_ = text_.size();
      effects.changed = true;
      break;
    default:
      break;
  }
  return effects;
}

// False for a key that does nothing here. Without Shift a step from a selection goes to the selection's end.
bool EditControl::OnKey(const Message& message) {
  const bool select = (message.lParam & key_data::kShift) != 0;
  const bool leaves = !select && caret_ != anchor_;
  switch (message.wParam) {
    case key::kLeft:
    case key::kUp:
      MoveTo(leaves ? SelectionBegin() : StepBack(text_, caret_), select);
      return true;
    case key::kRight:
    case key::kDown:
      MoveTo(leaves ? SelectionEnd() : StepOn(text_, caret_), select);
      return true;
    case key::kHome:
      MoveTo(0, select);
      return true;
    case key::kEnd:
      MoveTo(text_.size(), select);
      return true;
    case key::kDelete:
      if (!EraseSelection()) {
        Erase(caret_, StepOn(text_, caret_));
      }
      return true;
    default:
      return false;
  }
}

void EditControl::OnCharacter(char16_t character) {
  if (character == key::kBackspace) {
    if (!EraseSelection()) {
      Erase(StepBack(text_, caret_), caret_);
    }
  } else if (character >= u' ' && character != kRubOut) {
    EraseSelection();
    if (text_.size() < kMostCharacters) {
      text_.insert(caret_, 1, character);
      MoveTo(caret_ + 1, false);
    }
  }
}

void EditControl::MoveTo(std::size_t place, bool select) {
  caret_ = place;
  anchor_ = select ? anchor_ : place;
}

void EditControl::Erase(std::size_t begin, std::size_t end) {
  text_.erase(begin, end - begin);
  MoveTo(begin, false);
}

bool EditControl::EraseSelection() {
  const bool any = caret_ != anchor_;
  if (any) {
    Erase(SelectionBegin(), SelectionEnd());
  }
  return any;
}

}  // namespace panelglow::platform::desktop
