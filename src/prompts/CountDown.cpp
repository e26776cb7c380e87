#include "prompts/CountDown.h"

#include <algorithm>
#include <optional>

#include "harness/base/CDMUtil.h"
#include "prompts/PromptParts.h"

namespace panelglow {

using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr int kOneLine = 10'000;  // pixels: no line is broken

}  // namespace

CountDown::Step CountDown::Tick() {
  if (!IsRunning()) {
    return Step::kNothing;
  }
  ++elapsedTicks_;
  if (elapsedTicks_ > timeoutTicks_) {
    timeoutTicks_ = 0;
    return Step::kOver;
  }
  return elapsedTicks_ % (1000 / kTick_ms) == 0 ? Step::kSecond : Step::kNothing;
}

void CountDown::Arrange(WindowHandle window, const std::vector<WindowHandle>& buttons) {
  controls_.clear();
  if (!IsRunning()) {
    return;
  }
  text_ = CDMUtil::ToWString(CDMUtil::ToString((timeoutTicks_ - elapsedTicks_) * kTick_ms / 1000));
  const auto sizeOf = [&](const wstring& text) { return desktop_.MeasureText(text, kOneLine, kPromptFont); };
  std::vector<ButtonOutline> outlines;
  outlines.reserve(buttons.size());
  for (const WindowHandle button : buttons) {
    outlines.push_back({desktop_.WindowRectangle(button), sizeOf(desktop_.WindowText(button)).Width()});
  }
  const Rectangle client = desktop_.ClientRectangle(window);
  const Rectangle number = sizeOf(text_);
  place_ = PlaceOfCountDown({client.Width(), client.Height()}, {number.Width(), number.Height()}, outlines);
  for (const WindowHandle child : desktop_.Children(window)) {
    if (desktop_.IsWindowVisible(child) && Overlap(desktop_.WindowRectangle(child), place_.place)) {
      controls_.push_back(child);
    }
  }
}

bool CountDown::IsOn(WindowHandle control) const {
  return std::find(controls_.begin(), controls_.end(), control) != controls_.end();
}

void CountDown::Paint(platform::Canvas& canvas, WindowHandle surface) const {
  int x = place_.place.left;
  int y = place_.place.top;
  if (IsOn(surface)) {
    const Rectangle area = desktop_.WindowRectangle(surface);
    const int frame = (area.Width() - desktop_.ClientRectangle(surface).Width()) / 2;
    x -= area.left + frame;
    y -= area.top + frame;
  }
  canvas.DrawText(x, y, text_, kPromptFont, 0,
                  place_.coversCaption ? std::optional<platform::Color>(ground_) : std::nullopt);
}

}  // namespace panelglow
