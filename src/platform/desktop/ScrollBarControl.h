// A scroll bar: its state, the thumb that is dragged, and the arrow or part of the track that is held.
#pragma once

#include <cstdint>
#include <optional>

#include "platform/Desktop.h"
#include "platform/desktop/ControlEffects.h"
#include "platform/desktop/ScrollParts.h"

namespace panelglow::platform::desktop {

class ScrollBarControl {
 public:
  explicit ScrollBarControl(bool vertical) : vertical_(vertical) {}

  /// `frame`: the bar's own, with its left top corner at 0.
  ControlEffects Handle(const Message& message, const Rectangle& frame);

  /// The position is kept where a page from it on is within the range.
  void SetScroll(const ScrollState& state);
  [[nodiscard]] const ScrollState& Scroll() const { return scroll_; }

  [[nodiscard]] bool IsPressed() const { return thumbHeld_; }
  [[nodiscard]] bool IsVertical() const { return vertical_; }

 private:
  ControlEffects OnDown(const ScrollParts& parts, int x, int y);
  ControlEffects OnMove(const ScrollParts& parts, int x, int y);
  ControlEffects OnUp();
  ControlEffects OnRepeat(const ScrollParts& parts);
  [[nodiscard]] std::optional<std::uint32_t> RequestAt(const ScrollParts& parts) const;

  bool vertical_;
  ScrollState scroll_;
  bool thumbHeld_ = false;
  std::optional<std::uint32_t> heldRequest_;  // what an arrow or the track asks for while it is held
  int x_ = 0;  // of the mouse on the bar; while the thumb is held, of the grip within the thumb
  int y_ = 0;
};

}  // namespace panelglow::platform::desktop
