#include "prompts/CountDown.h"

#include <algorithm>
#include <cstdlib>

#include "harness/base/CDMUtil.h"
#include "prompts/PromptParts.h"

namespace panelglow {

using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr int kAboveBottom = 22;  // pixels from the window's lower edge to the number's upper one
constexpr int kGap = 6;           // pixels to what stands beside the number
constexpr int kOneLine = 10'000;  // pixels: no line is broken

bool Overlap(const Rectangle& a, const Rectangle& b) {
  return a.left < b.right && b.left < a.right && a.top < b.bottom && b.top < a.bottom;
}

}  // namespace

void CountDown::Arrange(WindowHandle window, const std::vector<WindowHandle>& buttons,
                        std::optional<std::uint32_t> seconds) {
  controls_.clear();
  coversCaption_ = false;
  text_ = seconds ? CDMUtil::ToWString(CDMUtil::ToString(*seconds)) : wstring();
  if (!seconds) {
    return;
  }
  const Rectangle client = desktop_.ClientRectangle(window);
  const Rectangle size = desktop_.MeasureText(text_, kOneLine, kPromptFont);
  place_ = PlaceAt(client.Width() / 5, client.Height() - kAboveBottom, size.Width(), size.Height());
  std::vector<Rectangle> inRow;  // the buttons beside the number, from left to right
  WindowHandle under = 0;        // the first of those that it stands on
  for (const WindowHandle button : buttons) {
    const Rectangle area = desktop_.WindowRectangle(button);
    if (Overlap(area, {0, place_.top, client.Width(), place_.bottom})) {
      inRow.push_back(area);
      under = under == 0 && Overlap(area, place_) ? button : under;
    }
  }
  if (under != 0) {
    MoveAside(inRow, client.Width());
    const bool isFree =
        std::none_of(inRow.begin(), inRow.end(), [&](const Rectangle& area) { return Overlap(area, place_); });
    if (!isFree) {
      MoveOnto(under);
    }
  }
  for (const WindowHandle child : desktop_.Children(window)) {
    if (desktop_.IsWindowVisible(child) && Overlap(desktop_.WindowRectangle(child), place_)) {
      controls_.push_back(child);
    }
  }
}

// To the nearest gap of a row of buttons that is wide enough; stays where it is when there is none.
void CountDown::MoveAside(const std::vector<Rectangle>& buttons, int clientWidth) {
  const int wanted = place_.left;
  const int width = place_.Width();
  std::optional<int> nearest;
  int gapBegin = 0;
  for (std::size_t i = 0; i <= buttons.size(); ++i) {
    const int gapEnd = i < buttons.size() ? buttons[i].left : clientWidth;
    if (gapEnd - gapBegin >= width + 2 * kGap) {
      const int left = std::clamp(wanted, gapBegin + kGap, gapEnd - kGap - width);
      nearest = nearest && std::abs(*nearest - wanted) <= std::abs(left - wanted) ? nearest : left;
    }
    gapBegin = i < buttons.size() ? buttons[i].right : clientWidth;
  }
  place_ = PlaceAt(nearest.value_or(wanted), place_.top, width, place_.Height());
}

// Beside the button's caption, or over its end where that leaves no room.
void CountDown::MoveOnto(WindowHandle button) {
  const Rectangle area = desktop_.WindowRectangle(button);
  const Rectangle caption = desktop_.MeasureText(desktop_.WindowText(button), kOneLine, kPromptFont);
  const int captionEnd = (area.left + area.right + caption.Width()) / 2;
  const int last = area.right - kGap - place_.Width();
  const int left = std::min(std::max(place_.left, captionEnd + kGap), last);
  coversCaption_ = left < captionEnd;
  place_ = PlaceAt(left, place_.top, place_.Width(), place_.Height());
}

bool CountDown::IsOn(WindowHandle control) const {
  return std::find(controls_.begin(), controls_.end(), control) != controls_.end();
}

void CountDown::Paint(platform::Canvas& canvas, WindowHandle surface) const {
  int x = place_.left;
  int y = place_.top;
  if (IsOn(surface)) {
    const Rectangle area = desktop_.WindowRectangle(surface);
    const int frame = (area.Width() - desktop_.ClientRectangle(surface).Width()) / 2;
    x -= area.left + frame;
    y -= area.top + frame;
  }
  canvas.DrawText(x, y, text_, kPromptFont, 0,
                  coversCaption_ ? std::optional<platform::Color>(ground_) : std::nullopt);
}

}  // namespace panelglow
