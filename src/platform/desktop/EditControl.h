// An entry field of one line: its text, the caret, and what is selected.
#pragma once

#include <cstddef>
#include <string_view>

#include "platform/Desktop.h"
#include "platform/desktop/ControlEffects.h"

namespace panelglow::platform::desktop {

class EditControl {
 public:
  ControlEffects Handle(const Message& message);

  /// The caret goes to the beginning, and nothing is selected.
  void SetText(std::u16string_view text);
  [[nodiscard]] const wstring& Text() const { return text_; }

  /// The caret is in front of this character.
  [[nodiscard]] std::size_t Caret() const { return caret_; }

  /// The characters from one place up to another; the same twice when none are selected.
  [[nodiscard]] std::size_t SelectionBegin() const;
  [[nodiscard]] std::size_t SelectionEnd() const;

 private:
  bool OnKey(const Message& message);
  void OnCharacter(char16_t character);
  void MoveTo(std::size_t place, bool select);
  void Erase(std::size_t begin, std::size_t end);
  bool EraseSelection();

  wstring text_;
  std::size_t caret_ = 0;
  std::size_t anchor_ = 0;  // the other end of the selection
};

}  // namespace panelglow::platform::desktop
