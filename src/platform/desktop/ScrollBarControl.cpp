#include "platform/desktop/ScrollBarControl.h"

#include <algorithm>
#include <utility>

namespace panelglow::platform::desktop {

namespace {

constexpr std::uint32_t kBeforeRepeat_ms = 300;
constexpr std::uint32_t kBetweenRepeats_ms = 50;

std::uintptr_t ScrollWord(std::uint32_t request, int position) {
  return (static_cast<std::uint32_t>(position) & 0xFFFFU) << 16U | request;
}

}  // namespace

ControlEffects ScrollBarControl::Handle(const Message& message, const Rectangle& frame) {
  const ScrollParts parts = PartsOfScrollBar(frame, vertical_, scroll_);
  switch (message.id) {
    case message::kLeftButtonDown:
      return OnDown(parts, XOf(message), YOf(message));
    case message::kMouseMove:
      return OnMove(parts, XOf(message), YOf(message));
    case message::kLeftButtonUp:
      return OnUp();
    case message::kTimer:
      return OnRepeat(parts);
    default:
      return {};
  }
}

void ScrollBarControl::SetScroll(const ScrollState& state) {
  scroll_ = state;
  const int highest = std::max(state.minimum, state.maximum - std::max(0, state.page - 1));
  scroll_.position = std::clamp(state.position, state.minimum, highest);
}

ControlEffects ScrollBarControl::OnDown(const ScrollParts& parts, int x, int y) {
  ControlEffects effects;
  x_ = x;
  y_ = y;
  if (parts.thumb.Contains(x, y)) {
    thumbHeld_ = true;
    x_ -= parts.thumb.left;
    y_ -= parts.thumb.top;
    effects.changed = true;  // it looks pressed before it is moved
    return effects;
  }
  heldRequest_ = RequestAt(parts);
  if (heldRequest_) {
    effects.timer_ms = kBeforeRepeat_ms;
    effects.scrollWords = {ScrollWord(*heldRequest_, 0)};
  }
  return effects;
}

ControlEffects ScrollBarControl::OnMove(const ScrollParts& parts, int x, int y) {
  ControlEffects effects;
  if (thumbHeld_) {
    const int along = vertical_ ? y - y_ - parts.track.top : x - x_ - parts.track.left;
    const long long covered = std::clamp(along, 0, parts.travel);
    const int position = static_cast<int>(covered * parts.distance / std::max(1, parts.travel));
    effects.scrollWords = {ScrollWord(scroll::kThumbTrack, scroll_.minimum + position)};
  } else if (heldRequest_) {
    x_ = x;
    y_ = y;
  }
  return effects;
}

ControlEffects ScrollBarControl::OnUp() {
  ControlEffects effects;
  const bool dragged = std::exchange(thumbHeld_, false);
  const bool asked = std::exchange(heldRequest_, std::nullopt).has_value();
  if (dragged || asked) {
    effects.changed = true;
    effects.timer_ms = 0;
    if (dragged) {
      effects.scrollWords.push_back(ScrollWord(scroll::kThumbPosition, scroll_.position));
    }
    effects.scrollWords.push_back(ScrollWord(scroll::kReleased, 0));
  }
  return effects;
}

// What is held asks again, as long as the mouse is still on the same part.
ControlEffects ScrollBarControl::OnRepeat(const ScrollParts& parts) {
  ControlEffects effects;
  effects.timer_ms = heldRequest_ ? kBetweenRepeats_ms : 0;
  if (heldRequest_ && RequestAt(parts) == heldRequest_) {
    effects.scrollWords = {ScrollWord(*heldRequest_, 0)};
  }
  return effects;
}

// What the part of the bar under the mouse asks for; nothing on the thumb and beside the bar.
std::optional<std::uint32_t> ScrollBarControl::RequestAt(const ScrollParts& parts) const {
  if (parts.backArrow.Contains(x_, y_)) {
    return scroll::kLineBack;
  }
  if (parts.forwardArrow.Contains(x_, y_)) {
    return scroll::kLineForward;
  }
  if (!parts.track.Contains(x_, y_) || parts.thumb.Contains(x_, y_)) {
    return std::nullopt;
  }
  const bool back = vertical_ ? y_ < parts.thumb.top : x_ < parts.thumb.left;
  return back ? scroll::kPageBack : scroll::kPageForward;
}

}  // namespace panelglow::platform::desktop
