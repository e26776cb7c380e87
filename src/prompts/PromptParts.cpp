#include "prompts/PromptParts.h"

#include <array>

#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "platform/Host.h"
#include "prompts/CDMWindow.h"

namespace panelglow {

namespace {

// Captions by result.
struct Caption {
  int textId;
  const char16_t* fallback;
};
constexpr std::array<Caption, 8> kCaptions{{{0, u""},
                                            {20016, u"&Abort"},
                                            {20012, u"&Cancel"},
                                            {20017, u"&Ignore"},
                                            {20015, u"&No"},
                                            {20011, u"&OK"},
                                            {20013, u"&Retry"},
                                            {20014, u"&Yes"}}};

// By style.
constexpr std::array<ButtonSet, 6> kButtonSets{{
    {{prompt_result::kOk, 0, 0}, 1, prompt_result::kOk},
    {{prompt_result::kOk, prompt_result::kCancel, 0}, 2, prompt_result::kOk},
    {{prompt_result::kAbort, prompt_result::kRetry, prompt_result::kIgnore}, 3, prompt_result::kIgnore},
    {{prompt_result::kYes, prompt_result::kNo, prompt_result::kCancel}, 3, prompt_result::kYes},
    {{prompt_result::kYes, prompt_result::kNo, 0}, 2, prompt_result::kYes},
    {{prompt_result::kRetry, prompt_result::kCancel, 0}, 2, prompt_result::kRetry},
}};

}  // namespace

const ButtonSet& ButtonSetOf(unsigned int promptStyle) {
  return kButtonSets[promptStyle < kButtonSets.size() ? promptStyle : 0];
}

wstring PromptCaption(int result) {
  const Caption& caption = kCaptions[static_cast<std::size_t>(result)];
  return CDMWindow::Text(caption.textId, caption.fallback);
}

wstring PromptTitle(const wstring& title) {
  return title.empty() ? CDMUtil::ToWString(platform::TheHost().files.ExecutablePath()) : title;
}

void LogNoWindow() {
  CDMout::LogMessage(LogOptions::ServiceErrors, kFreeText, "A prompt cannot be shown: there is no display.");
}

RegisteredClass::RegisteredClass(platform::Desktop& desktop, const platform::WindowClass& windowClass)
    : desktop_(desktop), name_(windowClass.name) {
  desktop_.RegisterWindowClass(windowClass);
}

RegisteredClass::~RegisteredClass() { desktop_.UnregisterWindowClass(name_); }

platform::WindowHandle CreateControl(platform::Desktop& desktop, platform::WindowHandle parent,
                                     const ControlRequest& request) {
  platform::WindowRequest window;
  window.className = request.className;
  window.text = request.text;
  window.style = request.style;
  window.x = request.place.left;
  window.y = request.place.top;
  window.width = request.place.Width();
  window.height = request.place.Height();
  window.parent = parent;
  const platform::WindowHandle control = desktop.CreateWindow(window);
  if (request.id != 0) {
    desktop.SetControlId(control, request.id);
  }
  desktop.SetFont(control, kPromptFont);
  return control;
}

void MoveControl(platform::Desktop& desktop, platform::WindowHandle control, const platform::Rectangle& place) {
  desktop.MoveWindow(control, place.left, place.top, place.Width(), place.Height());
}

}  // namespace panelglow
