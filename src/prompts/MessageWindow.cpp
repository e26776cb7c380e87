#include "prompts/MessageWindow.h"

#include <algorithm>
#include <limits>
#include <memory>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptParts.h"

namespace panelglow {

namespace message = platform::message;
using platform::Rectangle;

namespace {

constexpr const char* kClassName = "MessageWindowClassName";
constexpr const char16_t* kInnerText = u"_Halcyon_Test_";
constexpr std::uint32_t kFrameStyle = 0x92800001;
constexpr std::uint32_t kInnerStyle = 0xD0802000;
constexpr int kInnerId = 1000;
constexpr int kFrameBorder = 1;  // pixels

// The inner window lies in the middle of the frame; pixels from the frame's corner.
constexpr Rectangle kInnerPlace = PlaceAt(54, 29, 432, 232);

constexpr std::uint32_t kTimer = 1;
constexpr std::uint32_t kTick_ms = 100;

std::uint32_t TicksOf(int seconds) {
  constexpr std::int64_t kMost = std::numeric_limits<std::uint32_t>::max() / kTick_ms;
  return static_cast<std::uint32_t>(std::clamp<std::int64_t>(std::int64_t{seconds} * 1000 / kTick_ms, 0, kMost));
}

// What would reach the window from the keyboard, or tell it of focus.
bool IsSwallowed(std::uint32_t id) {
  switch (id) {
    case message::kActivate:
    case message::kSetFocus:
    case message::kKillFocus:
    case message::kUnicodeChar:
    case message::kHotKey:
    case message::kAppCommand:
      return true;
    default:
      return id >= message::kKeyDown && id <= message::kSysDeadChar;
  }
}

}  // namespace

int ShowMessageWindow(const wstring& text, const wstring& title, int seconds, platform::WindowProcedure hook) {
  return MessageWindow(text, title, seconds, std::move(hook)).Run();
}

MessageWindow::MessageWindow(const wstring& text, const wstring& title, int seconds, platform::WindowProcedure hook)
    : desktop_(platform::TheHost().desktop),
      text_(text),
      title_(PromptTitle(title)),
      hook_(std::move(hook)),
      timeoutTicks_(TicksOf(seconds)) {}

// The windows' messages are handled by this object, so they do not outlive it.
MessageWindow::~MessageWindow() { desktop_.DestroyWindow(frame_); }

int MessageWindow::Run() {
  const RegisteredClass registered(desktop_,
                                   {kClassName, kPromptClassStyle, 1, platform::kButtonFaceColor,
                                    [this](const platform::Message& received) { return Handle(received); }});
  if (!Create()) {
    LogNoWindow();
    return result_;
  }
  platform::Message received;
  while (desktop_.IsWindow(inner_) && desktop_.GetMessage(received)) {
    desktop_.Translate(received);
    desktop_.Dispatch(received);
  }
  desktop_.DestroyWindow(std::exchange(frame_, 0));
  return result_;
}

// The frame is shown when the inner window is there: its creation waits for the prompt lock, and until that is owned
// another prompt is open.
bool MessageWindow::Create() {
  platform::WindowRequest frame;
  frame.className = "STATIC";
  frame.text = title_;
  frame.style = kFrameStyle & ~platform::style::kVisible;
  frame.x = desktop_.ScreenWidth() / 2 - kFormWidth / 2;
  frame.y = desktop_.ScreenHeight() / 2 - kFormHeight / 2;
  frame.width = kFormWidth;
  frame.height = kFormHeight;
  frame_ = desktop_.CreateWindow(frame);
  if (frame_ == 0) {
    return false;
  }
  desktop_.SetFont(frame_, kPromptFont);
  const Rectangle place = PlaceAt(kInnerPlace.left - kFrameBorder, kInnerPlace.top - kFrameBorder,
                                  kInnerPlace.Width(), kInnerPlace.Height());
  inner_ = CreateControl(desktop_, frame_, {kClassName, kInnerStyle, kInnerId, place, kInnerText});
  desktop_.SetWindowPosition(frame_, platform::ZOrder::kTopmost, 0, 0, 0, 0, kShowInPlace);
  return inner_ != 0;
}

std::intptr_t MessageWindow::Handle(const platform::Message& received) {
  if (hook_ && hook_(received) == 0) {
    return 0;
  }
  if (IsSwallowed(received.id)) {
    return 0;
  }
  switch (received.id) {
    case message::kCreate:
      CDMWindow::LockPrompt();
      desktop_.SetExtraWord(received.window, 0, received.lParam);
      desktop_.SetTimer(received.window, kTimer, kTick_ms, nullptr);
      return 0;
    case message::kDestroy:
      CDMWindow::ReleasePrompt();
      return 0;
    case message::kTimer:
      OnTimer();
      return 0;
    case message::kPaint:
      Paint();
      return 0;
    case message::kClose:
      result_ = message_result::kClosed;
      break;
    default:
      break;
  }
  return desktop_.DefaultProcedure(received);
}

void MessageWindow::OnTimer() {
  if (timeoutTicks_ != 0) {
    ++elapsedTicks_;
    if (elapsedTicks_ > timeoutTicks_) {
      result_ = message_result::kTimedOut;
      desktop_.DestroyWindow(inner_);
      return;
    }
    desktop_.Invalidate(inner_);
  }
  desktop_.SetForegroundWindow(frame_);
  desktop_.SetFocus(inner_);
}

void MessageWindow::Paint() {
  const Rectangle client = desktop_.ClientRectangle(inner_);
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(inner_);
  platform::TextLayout wordBreak;
  wordBreak.wordBreak = true;
  canvas->DrawTextBox(client, text_, wordBreak, kPromptFont, 0, std::nullopt);
  if (timeoutTicks_ != 0) {
    const std::uint32_t seconds = (timeoutTicks_ - elapsedTicks_) * kTick_ms / 1000;
    canvas->DrawText((client.left + client.right) * 2 / 4, (client.top + client.bottom) * 3 / 4,
                     CDMUtil::ToWString(CDMUtil::ToString(seconds)), kPromptFont, 0, std::nullopt);
  }
}

}  // namespace panelglow
