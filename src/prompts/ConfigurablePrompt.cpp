#include "prompts/ConfigurablePrompt.h"

#include "prompts/CDMWindow.h"

namespace panelglow {

namespace message = platform::message;

namespace {

constexpr std::uint32_t kStopTimer = 1;
constexpr std::uint32_t kStopPeriod_ms = 5000;

}  // namespace

ConfigurablePrompt::ConfigurablePrompt(platform::Color background, const PromptRequest& request)
    : PromptWindow("MessageWindowClassName", background, request),
      background_(background),
      topmost_((request.style & kPromptTopmost) != 0) {}

void ConfigurablePrompt::StartTimer() { TheDesktop().SetTimer(TheWindow(), kStopTimer, kStopPeriod_ms, nullptr); }

void ConfigurablePrompt::OnTimer() {
  if (CDMWindow::IsStopRequested()) {
    End(prompt_result::kTerminated);
    return;
  }
  StartTimer();
  if (topmost_ && Intruder()) {
    TheDesktop().SetForegroundWindow(TheWindow());
    FocusFirstChild(true);
  }
}

void ConfigurablePrompt::OnFocus() {
  if (TheDesktop().Parent(TheDesktop().Focus()) != TheWindow()) {
    FocusFirstChild(true);
  }
}

// Buttons and texts take the configured colour.
std::optional<std::intptr_t> ConfigurablePrompt::HandleOwn(const platform::Message& received) {
  const bool isColor = received.id == message::kControlColorButton || received.id == message::kControlColorStatic;
  return isColor ? std::optional<std::intptr_t>(platform::OwnControlColor(background_)) : std::nullopt;
}

}  // namespace panelglow
