// Where the parts of a scroll bar are: drawing and mouse handling agree by sharing this.
#pragma once

#include <algorithm>

#include "platform/Desktop.h"

namespace panelglow::platform::desktop {

struct ScrollParts {
  Rectangle backArrow;
  Rectangle track;
  Rectangle thumb;  // within the track; empty when there is nothing to scroll
  Rectangle forwardArrow;
  int travel = 0;    // pixels that the thumb can move
  int distance = 0;  // positions that this covers
};

/// `frame` is the bar's rectangle in any coordinates; the parts are in the same ones.
inline ScrollParts PartsOfScrollBar(const Rectangle& frame, bool vertical, const ScrollState& state) {
  constexpr int kShortestThumb = 8;  // pixels
  ScrollParts parts;
  const int length = vertical ? frame.Height() : frame.Width();
  const int arrow = std::min(vertical ? frame.Width() : frame.Height(), length / 2);
  const auto part = [&](int from, int to) {
    return vertical ? Rectangle{frame.left, frame.top + from, frame.right, frame.top + to}
                    : Rectangle{frame.left + from, frame.top, frame.left + to, frame.bottom};
  };
  parts.backArrow = part(0, arrow);
  parts.track = part(arrow, length - arrow);
  parts.forwardArrow = part(length - arrow, length);
  const int room = length - 2 * arrow;
  const int range = state.maximum - state.minimum + 1;
  parts.distance = range - std::max(1, state.page);
  if (parts.distance <= 0 || room <= kShortestThumb) {
    return parts;
  }
  const auto scaled = [](int value, int by, int of) {
    return static_cast<int>(static_cast<long long>(value) * by / of);
  };
  const int thumb = std::clamp(scaled(room, std::max(1, state.page), range), kShortestThumb, room);
  parts.travel = room - thumb;
  const int at = arrow + scaled(parts.travel, state.position - state.minimum, parts.distance);
  parts.thumb = part(at, at + thumb);
  return parts;
}

}  // namespace panelglow::platform::desktop
