#include "prompts/TextWindow.h"

#include <utility>

#include "platform/Host.h"
#include "prompts/CDMWindow.h"
#include "prompts/PromptParts.h"

namespace panelglow {

namespace message = platform::message;
using platform::Rectangle;

namespace {

constexpr const char* kClassName = "TextWindowClassName";
constexpr std::uint32_t kWindowStyle = 0x90800001;
constexpr std::uint32_t kInputStyle = 0x50810000;
constexpr std::uint32_t kLabelStyle = 0x50000000;
constexpr int kOkId = kFirstButtonId + prompt_result::kOk;
constexpr int kInputId = 1100;
constexpr Rectangle kOkPlace = PlaceAt(245, 255, 50, 25);
constexpr Rectangle kInputPlace = PlaceAt(120, 190, 300, 25);
constexpr Rectangle kLabelPlace = PlaceAt(10, 10, 520, 140);

constexpr std::uint32_t kClearTimer = 1500;
constexpr std::size_t kLongestLine = 255;  // characters: a read of 256 ends with a zero
constexpr std::uintptr_t kEnterKey = 13;

// A key's release has an odd message number, with and without Alt.
bool IsEnterRelease(const platform::Message& received) {
  return (received.id & 1U) != 0 && received.wParam == kEnterKey;
}

}  // namespace

int ShowTextWindow(const wstring& text, const wstring& title, std::string& entered, std::uint32_t clearInterval_ms) {
  return TextWindow(text, title, clearInterval_ms).Run(entered);
}

TextWindow::TextWindow(const wstring& text, const wstring& title, std::uint32_t clearInterval_ms)
    : desktop_(platform::TheHost().desktop),
      text_(text),
      title_(PromptTitle(title)),
      clearInterval_ms_(clearInterval_ms) {}

// The window's messages are handled by this object, so it does not outlive it.
TextWindow::~TextWindow() { desktop_.DestroyWindow(window_); }

int TextWindow::Run(std::string& entered) {
  const RegisteredClass registered(desktop_,
                                   {kClassName, kPromptClassStyle, 1, platform::kButtonFaceColor,
                                    [this](const platform::Message& received) { return Handle(received); }});
  if (!Create()) {
    LogNoWindow();
    return prompt_result::kNone;
  }
  CreateControls();
  platform::Message received;
  while (desktop_.GetMessage(received)) {
    if (!desktop_.IsDialogMessage(window_, received)) {
      desktop_.Translate(received);
      desktop_.Dispatch(received);
    }
    if (result_ == prompt_result::kOk || IsEnterRelease(received)) {
      entered = EnteredLine();
      desktop_.SetProcedure(input_, std::move(inputProcedure_));
      break;
    }
  }
  desktop_.DestroyWindow(std::exchange(window_, 0));
  return result_;
}

bool TextWindow::Create() {
  platform::WindowRequest request;
  request.className = kClassName;
  request.text = title_;
  request.style = kWindowStyle;
  request.x = desktop_.ScreenWidth() / 2 - kFormWidth / 2;
  request.y = desktop_.ScreenHeight() / 2 - kFormHeight / 2;
  request.width = kFormWidth;
  request.height = kFormHeight;
  window_ = desktop_.CreateWindow(request);
  if (window_ == 0) {
    return false;
  }
  desktop_.SetWindowPosition(window_, platform::ZOrder::kTopmost, 0, 0, 0, 0, kShowInPlace);
  return true;
}

void TextWindow::CreateControls() {
  CreateControl(desktop_, window_,
                {"BUTTON", kDefaultButtonStyle, kOkId, kOkPlace, PromptCaption(prompt_result::kOk)});
  input_ = CreateControl(desktop_, window_, {"EDIT", kInputStyle, kInputId, kInputPlace, wstring()});
  inputProcedure_ =
      desktop_.SetProcedure(input_, [this](const platform::Message& received) { return FilterInput(received); });
  CreateControl(desktop_, window_, {"STATIC", kLabelStyle, 0, kLabelPlace, text_});
  desktop_.SetFocus(input_);
}

std::intptr_t TextWindow::Handle(const platform::Message& received) {
  switch (received.id) {
    case message::kCreate:
      OnCreate(received);
      break;
    case message::kDestroy:
      CDMWindow::ReleasePrompt();
      return 0;
    case message::kSetFocus:
      desktop_.SetFocus(input_);
      break;
    case message::kCommand:
      if (static_cast<int>(received.wParam & 0xFFFFU) == kOkId) {
        result_ = prompt_result::kOk;
      }
      break;
    case message::kTimer:
      desktop_.SetWindowText(input_, u"");
      desktop_.SetForegroundWindow(received.window);
      break;
    case message::kGetDefaultId:
      return 0;  // Enter ends the line; it does not stand for the button
    case message::kClose:
      return 0;  // the loop waits for a line, and closing the window gives none
    default:
      break;
  }
  return desktop_.DefaultProcedure(received);
}

// The lock is taken while the window is being created: the call blocks while another prompt is open.
void TextWindow::OnCreate(const platform::Message& received) {
  CDMWindow::LockPrompt();
  desktop_.SetExtraWord(received.window, 0, received.lParam);
  desktop_.SetForegroundWindow(received.window);
  desktop_.SetTimer(received.window, kClearTimer, clearInterval_ms_, nullptr);
}

std::intptr_t TextWindow::FilterInput(const platform::Message& received) {
  if (received.id == message::kChar) {
    desktop_.SetTimer(window_, kClearTimer, clearInterval_ms_, nullptr);
  }
  return inputProcedure_(received);
}

std::string TextWindow::EnteredLine() {
  return platform::CodePageFromWide(desktop_.WindowText(input_).substr(0, kLongestLine));
}

}  // namespace panelglow
