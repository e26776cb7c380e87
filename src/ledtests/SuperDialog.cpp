#include "ledtests/SuperDialog.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "ledtests/BlinkWorkers.h"
#include "ledtests/FrontPanelTest.h"
#include "ledtests/LedKind.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"

namespace panelglow {

namespace message = platform::message;
namespace position = platform::position;
using platform::Rectangle;
using platform::WindowHandle;

namespace {

constexpr const char* kClassName = "MainWindowClassName";
constexpr std::uint32_t kClassStyle = 3;  // redraw on horizontal and vertical size change
constexpr platform::Color kBackground = 0x00C0C0C0;
constexpr std::uint32_t kWindowStyle = 0x90400001;  // popup, visible, dialog frame
constexpr std::uint32_t kIconStyle = 0x50000003;
constexpr std::uint32_t kLedButtonStyle = 0x58010000;  // child, visible, disabled, tab stop
constexpr std::uint32_t kStartButtonStyle = 0x50010001;
constexpr platform::Font kFont{18, 600};

// Flags of SetWindowPosition at its three places.
constexpr std::uint32_t kPlaceFlags = position::kNoSize | position::kNoZOrder | position::kShowWindow;  // 69
constexpr std::uint32_t kCreateFlags =
    position::kNoSize | position::kNoMove | position::kNoZOrder | position::kShowWindow;              // 71
constexpr std::uint32_t kRaiseFlags = position::kNoSize | position::kNoMove | position::kShowWindow;  // 67

// Layout, in pixels from the client origin.
constexpr int kWindowWidth = 615;
constexpr int kWindowHeight = 608;
constexpr int kIconSize = 32;
constexpr int kLogoY = 10;
constexpr int kLeftLogoX = 10;
constexpr int kRightLogoX = 560;
constexpr int kColumns = 3;
constexpr int kGridY = 150;
constexpr int kRowStep = 46;
constexpr int kIconX = 15;
constexpr int kIconStep = 200;
constexpr int kButtonX = 58;
constexpr int kButtonStep = 202;
constexpr int kButtonWidth = 130;
constexpr int kButtonHeight = 30;
constexpr Rectangle kStartPlace{170, 543, 270, 573};
constexpr Rectangle kCancelPlace{380, 544, 480, 574};
constexpr int kHeadingX = 220;
constexpr int kHeadingY = 50;
constexpr Rectangle kInstructionPlace{30, 75, 600, 200};

// Texts.
constexpr int kHeadingText = 23;
constexpr int kInstructionText = 24;
constexpr int kStartText = 59;
constexpr int kCancelText = 60;

constexpr std::uint32_t kCancelCommand = 999;

constexpr std::uint32_t kSecondsTimer = 1;
constexpr std::uint32_t kForegroundTimer = 2;
constexpr std::uint32_t kSecond_ms = 1000;
constexpr std::uint32_t kForegroundPeriod_ms = 1;

constexpr const char* kCancelledCode = "990354";

platform::Clock& TheClock() { return platform::TheHost().clock; }

}  // namespace

SuperDialog::SuperDialog(FrontPanelTest& test) : test_(test), desktop_(platform::TheHost().desktop) {}

// The window's messages are handled by this object, so it does not outlive it.
SuperDialog::~SuperDialog() { desktop_.DestroyWindow(window_); }

void SuperDialog::CreateSuperDialog() {
  constexpr std::uint32_t kBeforeWindow_ms = 200;
  desktop_.RegisterWindowClass({kClassName, kClassStyle, 1, kBackground,
                                [this](const platform::Message& received) { return CustomLEDDlgProc(received); }});
  TheClock().Sleep(kBeforeWindow_ms);
  CDMout::UpdatePercentage(40);
  if (!CreateMainWindow()) {
    CDMout::LogMessage(LogOptions::ServiceErrors, kFreeText, "The test dialog cannot be shown: there is no display.");
    test_.dialogLost = true;
    desktop_.UnregisterWindowClass(kClassName);
    return;
  }
  CreateControls();
  test_.exitDialog = false;
  CDMout::UpdatePercentage(50);
  if (test_.rules.startsByItself) {
    BeginTest(window_);
  }
  RunLoop();
  if (!test_.exitDialog) {
    CDMout::LogMessage(LogOptions::ServiceErrors, kFreeText, "The test dialog was lost: the display is gone.");
    test_.dialogLost = true;
    Leave(window_);
  }
  EndWorkers();
  desktop_.UnregisterWindowClass(kClassName);
  CDMout::UpdatePercentage(80);
}

bool SuperDialog::CreateMainWindow() {
  platform::WindowRequest request;
  request.className = kClassName;
  request.style = kWindowStyle;
  request.extendedStyle = platform::style::kExTopmost;
  request.width = kWindowWidth;
  request.height = kWindowHeight;
  window_ = desktop_.CreateWindow(request);
  if (window_ == 0) {
    return false;
  }
  desktop_.SetWindowPosition(window_, platform::ZOrder::kTop, (desktop_.ScreenWidth() - kWindowWidth) / 2,
                             (desktop_.ScreenHeight() - kWindowHeight) / 2, 0, 0, kPlaceFlags);
  return true;
}

WindowHandle SuperDialog::CreateControl(const char* className, std::uint32_t style, const wstring& text,
                                        const Rectangle& place, int id) {
  platform::WindowRequest request;
  request.className = className;
  request.text = text;
  request.style = style;
  request.x = place.left;
  request.y = place.top;
  request.width = place.Width();
  request.height = place.Height();
  request.parent = window_;
  const WindowHandle control = desktop_.CreateWindow(request);
  if (id != 0) {
    desktop_.SetControlId(control, id);
  }
  desktop_.SetFont(control, kFont);
  return control;
}

void SuperDialog::CreateIcon(const std::string& file, int x, int y) {
  const WindowHandle icon = CreateControl("STATIC", kIconStyle, {}, {x, y, x + kIconSize, y + kIconSize}, 0);
  desktop_.SetIcon(icon, platform::WideFromUtf8(file));
}

void SuperDialog::CreateControls() {
  CreateIcon("super.ico", kLeftLogoX, kLogoY);
  CreateIcon("diags.ico", kRightLogoX, kLogoY);
  const std::vector<DialogButton>& buttons = test_.rules.buttons;
  const auto column = [](std::size_t i) { return static_cast<int>(i) % kColumns; };
  const auto top = [](std::size_t i) { return kGridY + static_cast<int>(i) / kColumns * kRowStep; };
  for (std::size_t i = 0; i < buttons.size(); ++i) {
    CreateIcon(buttons[i].icon, kIconX + column(i) * kIconStep, top(i));
  }
  for (std::size_t i = 0; i < buttons.size(); ++i) {
    const int left = kButtonX + column(i) * kButtonStep;
    CreateControl("BUTTON", kLedButtonStyle, buttons[i].caption,
                  {left, top(i), left + kButtonWidth, top(i) + kButtonHeight}, buttons[i].command);
  }
  const WindowHandle start = CreateControl("BUTTON", kStartButtonStyle, CDMDiag::GetResourceString(kStartText, u""),
                                           kStartPlace, static_cast<int>(kNextCommand));
  CreateControl("BUTTON", kLedButtonStyle, CDMDiag::GetResourceString(kCancelText, u""), kCancelPlace,
                static_cast<int>(kCancelCommand));
  desktop_.SetFocus(start);
}

void SuperDialog::RunLoop() {
  platform::Message received;
  while (desktop_.GetMessage(received) && !test_.exitDialog) {
    if (!desktop_.IsDialogMessage(window_, received)) {
      desktop_.Translate(received);
      desktop_.Dispatch(received);
    }
  }
}

// ---- the sequence of LEDs

void SuperDialog::EnableCustomWindowCtrls(WindowHandle window) {
  const auto enable = [&](int id, bool enabled) {
    const WindowHandle control = desktop_.FindControl(window, id);
    if (control != 0) {
      desktop_.EnableWindow(control, enabled);
    }
    return control;
  };
  enable(static_cast<int>(kCancelCommand), true);
  enable(static_cast<int>(kNextCommand), false);
  bool focused = false;
  for (const DialogButton& button : test_.rules.buttons) {
    const WindowHandle control = enable(button.command, true);
    if (control != 0 && !std::exchange(focused, true)) {
      desktop_.SetFocus(control);
    }
  }
}

// Starts the next LED that is not confirmed, or leaves the dialog when there is none.
void SuperDialog::BeginTest(WindowHandle window) {
  EnableCustomWindowCtrls(window);
  if (!test_.testStarted) {
    test_.timerCounting = true;
  }
  test_.secondsElapsed = 0;
  test_.testStarted = true;
  int index = 0;
  while (index < test_.deviceCount && test_.devices[static_cast<std::size_t>(index)].tested) {
    ++index;
  }
  if (index == test_.deviceCount) {
    PostCommand(window, kLeaveCommand);
    return;
  }
  if (test_.devices[static_cast<std::size_t>(index)].cheatCheck) {
    index = ChooseAfterRepeatCheck(index);
  }
  LEDStruct& entry = test_.devices[static_cast<std::size_t>(index)];
  entry.running = true;
  entry.tested = false;
  test_.failureCode = entry.defaultErrorCode;
  test_.currentIndex = index;
  SendCommand(window, entry.startCommand);
}

// Before the last LED an already confirmed one may come again, any number of times: an operator who only counts the
// LEDs that are left cannot know which one it is.
int SuperDialog::ChooseAfterRepeatCheck(int index) {
  constexpr int kHighestLevel = 3;
  constexpr int kDice = 20;
  constexpr int kChancePerLevel = 5;
  constexpr std::uint32_t kPause_ms = 1000;
  std::srand(static_cast<unsigned int>(TheClock().WallTime()));
  const int roll = std::rand() % kDice;
  test_.cheatLevel = std::min(test_.cheatLevel + 1, kHighestLevel);
  const int chosen = roll >= test_.cheatLevel * kChancePerLevel ? index - 1 : index;
  TheClock().Sleep(kPause_ms);
  return chosen;
}

void SuperDialog::PostCommand(WindowHandle window, std::uint32_t command) {
  desktop_.Post({window, message::kCommand, command, 0});
}

void SuperDialog::SendCommand(WindowHandle window, std::uint32_t command) {
  desktop_.Send({window, message::kCommand, command, 0});
}

// ---- messages

std::intptr_t SuperDialog::CustomLEDDlgProc(const platform::Message& received) {
  switch (received.id) {
    case message::kCreate:
      OnCreate(received);
      break;
    case message::kDestroy:
      CDMWindow::ReleasePrompt();
      desktop_.PostQuit();
      break;
    case message::kKillFocus:
      desktop_.SetWindowPosition(received.window, platform::ZOrder::kTopmost, 0, 0, 0, 0, kRaiseFlags);
      desktop_.SetForegroundWindow(received.window);
      desktop_.SetActiveWindow(received.window);
      break;
    case message::kSetFocus:
    case message::kLeftButtonUp:
      KeepFocusInside(received.window);
      break;
    case message::kTimer:
      return OnTimer(received.window);
    case message::kPaint:
      OnPaint(received.window);
      return 1;
    case message::kCommand:
      return OnCommand(received);
    case message::kClose:
      // Closed by other means than its buttons: the LEDs that are left have not been answered, so this is no pass.
      SendCommand(received.window, kCancelCommand);
      return 0;
    default:
      break;
  }
  return desktop_.DefaultProcedure(received);
}

void SuperDialog::OnCreate(const platform::Message& received) {
  window_ = received.window;
  CDMWindow::LockPrompt();
  desktop_.SetExtraWord(received.window, 0, received.lParam);
  test_.secondsTimer = desktop_.SetTimer(received.window, kSecondsTimer, kSecond_ms, nullptr);
  test_.foregroundTimer =
      desktop_.SetTimer(received.window, kForegroundTimer, kForegroundPeriod_ms,
                        [this](WindowHandle window, std::uint32_t /*timer*/) { CustomTimerProc(window); });
  test_.secondsElapsed = 0;
  test_.testStarted = false;
  desktop_.SetWindowPosition(received.window, platform::ZOrder::kTopmost, 0, 0, 0, 0, kCreateFlags);
  desktop_.SetForegroundWindow(received.window);
  desktop_.SetActiveWindow(received.window);
}

void SuperDialog::CustomTimerProc(WindowHandle window) {
  desktop_.SetForegroundWindow(window);
  desktop_.Send({window, message::kSetFocus, 0, 0});
}

void SuperDialog::KeepFocusInside(WindowHandle window) {
  if (desktop_.Parent(desktop_.Focus()) != window) {
    desktop_.SetFocus(desktop_.FindControl(window, FirstButton()));
  }
}

// Of the grid once the test has started; before that the start button.
int SuperDialog::FirstButton() const {
  const std::vector<DialogButton>& buttons = test_.rules.buttons;
  return test_.testStarted && !buttons.empty() ? buttons.front().command : static_cast<int>(kNextCommand);
}

std::intptr_t SuperDialog::OnTimer(WindowHandle window) {
  if (!test_.timerCounting) {
    return 1;
  }
  if (test_.secondsElapsed >= test_.ledTimeout) {
    test_.testResult = FrontPanelTest::kTimedOut;
    PostCommand(window, kLeaveCommand);
  } else {
    ++test_.secondsElapsed;
  }
  return 1;
}

void SuperDialog::OnPaint(WindowHandle window) {
  const std::unique_ptr<platform::Canvas> canvas = desktop_.BeginPaint(window);
  canvas->DrawText(kHeadingX, kHeadingY, CDMDiag::GetResourceString(kHeadingText, u""), kFont, 0, kBackground);
  canvas->DrawTextBox(kInstructionPlace, CDMDiag::GetResourceString(kInstructionText, u""), {true, true}, kFont, 0,
                      kBackground);
}

std::intptr_t SuperDialog::OnCommand(const platform::Message& received) {
  const auto command = static_cast<std::uint32_t>(received.wParam & 0xFFFFU);
  switch (command) {
    case kLeaveCommand:
      return Leave(received.window);
    case kCancelCommand:
      test_.failureCode = kCancelledCode;
      test_.testResult = FrontPanelTest::kCancelled;
      SendCommand(received.window, kLeaveCommand);
      return 1;
    case kNextCommand:
      BeginTest(received.window);
      return 1;
    default:
      break;
  }
  if (const LedKind* kind = FindLedKindByStartCommand(command)) {
    if (LEDStruct* entry = EntryFor(*kind)) {
      StartWorker(*kind, *entry);
      return 0;
    }
  }
  if (const ButtonAnswer* answer = FindAnswer(command)) {
    return Answer(received.window, *answer);
  }
  return desktop_.DefaultProcedure(received);
}

}  // namespace panelglow
