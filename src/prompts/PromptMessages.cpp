// What a prompt does with its window's messages.
#include <algorithm>
#include <utility>

#include "harness/base/CDMout.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptParts.h"
#include "prompts/PromptWindow.h"

namespace panelglow {

namespace message = platform::message;
using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr std::uint32_t kTickTimer = 0;
constexpr std::uint32_t kStopTimer = 1;
constexpr std::uint32_t kStopPeriod_ms = 5000;

}  // namespace

// ---- the window's messages

std::intptr_t PromptWindow::Handle(const platform::Message& received) {
  switch (received.id) {
    case message::kCreate:
      OnCreate(received.window);
      break;
    case message::kDestroy:
      CDMWindow::ReleasePrompt();
      break;
    case message::kSize:
      OnSize(received);
      break;
    case message::kSetFocus:
    case message::kLeftButtonUp:
      if (!family_.configurable) {
        FocusFirstChild(false);
      } else if (desktop_.Parent(desktop_.Focus()) != received.window) {
        FocusFirstChild(true);
      }
      break;
    case message::kKillFocus:
      desktop_.SetWindowPosition(received.window, platform::ZOrder::kTopmost, 0, 0, 0, 0, kShowInPlace);
      desktop_.SetForegroundWindow(received.window);
      desktop_.SetActiveWindow(received.window);
      break;
    case message::kGetMinMaxInfo: {
      // A message carries the address as a number. NOLINTNEXTLINE(performance-no-int-to-ptr)
      auto* limits = reinterpret_cast<platform::TrackLimits*>(received.lParam);
      *limits = {kFormWidth, kImageFormHeight, desktop_.ScreenWidth(), desktop_.ScreenHeight()};
      break;
    }
    case message::kCommand: {
      const auto id = static_cast<int>(received.wParam & 0xFFFFU);
      if (id > kFirstButtonId && id <= kFirstButtonId + prompt_result::kYes) {
        End(id - kFirstButtonId);
      }
      break;
    }
    case message::kClose:
      return 0;  // a prompt asks for an answer, and closing is none; as with Escape, it stays
    case message::kTimer:
      OnTimer();
      break;
    case message::kHorizontalScroll:
    case message::kVerticalScroll:
      OnScroll(received);
      break;
    case message::kPaint:
      return OnPaint(received);
    case message::kSyncPaint:
      if (hasImage_) {
        PaintImage();
      }
      return 0;
    case message::kControlColorButton:
    case message::kControlColorStatic:
      if (family_.configurable) {
        return platform::OwnControlColor(family_.background);  // buttons and texts take the configured colour
      }
      break;
    case message::kDeviceChange:
      if (!family_.configurable) {
        OnDeviceChange(received.wParam);
      }
      break;
    default:
      break;
  }
  return desktop_.DefaultProcedure(received);
}

// The lock is taken while the window is being created: the call blocks while another prompt is open.
void PromptWindow::OnCreate(WindowHandle created) {
  window_ = created;
  CDMWindow::LockPrompt();
  if (family_.configurable) {
    desktop_.SetTimer(created, kStopTimer, kStopPeriod_ms, nullptr);
  } else if (topmost_) {
    desktop_.SetTimer(created, kTickTimer, kTick_ms, nullptr);
  }
  desktop_.SetForegroundWindow(created);
}

void PromptWindow::OnSize(const platform::Message& received) {
  const auto packed = static_cast<std::uint32_t>(received.lParam);
  const int width = static_cast<int>(packed & 0xFFFFU);
  const int height = static_cast<int>(packed >> 16U);
  if (width == 0 || height == 0) {
    return;
  }
  clientWidth_ = width;
  clientHeight_ = height;
  const auto move = [this](WindowHandle control, const Rectangle& place) {
    desktop_.MoveWindow(control, place.left, place.top, place.Width(), place.Height());
  };
  if (!request_.imageForm) {
    return;  // of fixed size, and its controls with it
  }
  if (textControl_ != 0) {
    move(textControl_, TextFieldPlace());
  }
  if (imageControl_ != 0) {
    move(imageControl_, ImageAreaPlace());
    SetScrollRanges();
    move(horizontalBar_, HorizontalBarPlace());
    move(verticalBar_, VerticalBarPlace());
  }
  if (!buttons_.empty()) {
    PlaceButtonRow();
  }
  horizontalPosition_ = 0;
  verticalPosition_ = 0;
  desktop_.Invalidate(received.window);
}

void PromptWindow::OnTimer() {
  if (family_.configurable) {
    if (CDMWindow::IsStopRequested()) {
      End(prompt_result::kTerminated);
      return;
    }
    desktop_.SetTimer(window_, kStopTimer, kStopPeriod_ms, nullptr);
    if (topmost_) {
      KeepForeground();
    }
    return;
  }
  ThePromptState().promptEvents |= kPromptTick;
  CheckWorker();
  if (topmost_) {
    KeepForeground();
  }
  CountTick();
}

// A worker that returns without being done is started again at the next tick.
void PromptWindow::CheckWorker() {
  PromptState& state = ThePromptState();
  if (!request_.autoWorker || state.workerRunning) {
    return;
  }
  if (state.workerDone) {
    End(request_.autoResult);
    return;
  }
  state.workerRunning = true;
  const platform::ThreadHandle thread =
      platform::TheHost().threads.Start("prompt worker", [worker = request_.autoWorker, &state] {
        worker(state.workerDone);
        state.workerRunning = false;
      });
  if (thread == 0) {
    state.workerRunning = false;  // tried again at the next tick
  }
}

// Takes the foreground back, but not from a window with the same title: prompts of sister processes do not fight.
void PromptWindow::KeepForeground() {
  const WindowHandle foreground = desktop_.ForegroundWindow();
  if (foreground == window_ || desktop_.WindowText(foreground) == request_.title) {
    return;
  }
  if (!family_.configurable) {
    desktop_.AttachInput(foreground, true);
  }
  desktop_.SetForegroundWindow(window_);
  if (!family_.configurable) {
    desktop_.SetFocus(window_);
    desktop_.AttachInput(foreground, false);
  }
  FocusFirstChild(true);
}

void PromptWindow::CountTick() {
  if (timeoutTicks_ == 0) {
    return;
  }
  ++elapsedTicks_;
  if (elapsedTicks_ > timeoutTicks_) {
    End(ThePromptState().timeoutResult);
    timeoutTicks_ = 0;
    desktop_.Invalidate(window_);  // which stays when the result is 0, and has nothing to count any more
  }
  if (elapsedTicks_ % (1000 / kTick_ms) == 0) {
    desktop_.Invalidate(window_);
  }
}

void PromptWindow::OnScroll(const platform::Message& received) {
  const bool vertical = received.id == message::kVerticalScroll;
  const WindowHandle bar = vertical ? verticalBar_ : horizontalBar_;
  const int largest = vertical ? imageHeight_ : imageWidth_;
  int place = desktop_.Scroll(bar).position;
  switch (received.wParam & 0xFFFFU) {
    case platform::scroll::kLineBack:
      place = std::max(0, place - 1);
      break;
    case platform::scroll::kLineForward:
      place = std::min(largest, place + 1);
      break;
    case platform::scroll::kThumbPosition:
    case platform::scroll::kThumbTrack:
      place = static_cast<int>(received.wParam >> 16U & 0xFFFFU);
      break;
    case platform::scroll::kStart:
      place = 0;
      break;
    case platform::scroll::kEnd:
      place = largest;
      break;
    default:
      break;
  }
  (vertical ? verticalPosition_ : horizontalPosition_) = place;
  platform::ScrollState state = desktop_.Scroll(bar);
  state.position = place;
  desktop_.SetScroll(bar, state);
  desktop_.Invalidate(received.window);
}

std::intptr_t PromptWindow::OnPaint(const platform::Message& received) {
  if (hasImage_) {
    PaintImage();
  }
  const std::vector<WindowHandle> former = countDown_.Controls();
  std::vector<WindowHandle> buttons;
  for (const Button& button : buttons_) {
    buttons.push_back(button.window);
  }
  countDown_.Arrange(window_, buttons, SecondsLeft());
  for (const WindowHandle control : former) {
    if (!countDown_.IsOn(control)) {
      PaintControl(control);  // takes the number away
    }
  }
  if (timeoutTicks_ == 0) {
    return desktop_.DefaultProcedure(received);
  }
  for (const WindowHandle control : countDown_.Controls()) {
    PaintControl(control);
  }
  countDown_.Paint(*desktop_.BeginPaint(received.window), received.window);
  return 0;
}

void PromptWindow::PaintImage() {
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(imageControl_);
  canvas->DrawImage(-horizontalPosition_, -verticalPosition_, request_.imagePath,
                    desktop_.ClientRectangle(imageControl_));
}

// What this window paints on one of its controls: the marked text, and the count-down where that lies on it.
void PromptWindow::PaintControl(WindowHandle control) {
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(control);
  if (control == markedPane_) {
    PaintMarkedText(*canvas);
  }
  if (countDown_.IsOn(control)) {
    countDown_.Paint(*canvas, control);
  }
}

std::optional<std::uint32_t> PromptWindow::SecondsLeft() const {
  if (timeoutTicks_ == 0) {
    return std::nullopt;
  }
  return (timeoutTicks_ - elapsedTicks_) * kTick_ms / 1000;
}

void PromptWindow::PaintMarkedText(platform::Canvas& canvas) const {
  for (const PlacedText& part : markedText_) {
    const platform::Color ground = part.piece.background.value_or(family_.background);
    canvas.DrawText(part.x, part.y, part.piece.text, kPromptFont, platform::ReadableOn(ground),
                    part.piece.background);
  }
}

std::intptr_t PromptWindow::HandlePane(const platform::Message& received) {
  if (received.id != message::kPaint) {
    return desktop_.DefaultProcedure(received);
  }
  PaintControl(received.window);
  return 0;
}

void PromptWindow::OnDeviceChange(std::uintptr_t event) {
  std::atomic<std::uint32_t>& events = ThePromptState().promptEvents;
  switch (event) {
    case platform::device_event::kNodesChanged:
      events |= kDeviceTreeChanged;
      break;
    case platform::device_event::kArrival:
      events |= kDeviceArrived;
      break;
    case platform::device_event::kRemoveComplete:
      events |= kDeviceRemoved;
      break;
    default:
      break;
  }
}

bool PromptWindow::IsButton(WindowHandle control) const {
  return std::any_of(buttons_.begin(), buttons_.end(), [&](const Button& b) { return b.window == control; });
}

void PromptWindow::FocusFirstChild(bool onlyButton) {
  const std::vector<WindowHandle> children = desktop_.Children(window_);
  if (children.empty()) {
    return;
  }
  if (IsButton(children.front()) || !onlyButton) {
    desktop_.SetFocus(children.front());
  }
}

}  // namespace panelglow
