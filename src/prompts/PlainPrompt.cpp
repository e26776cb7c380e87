#include "prompts/PlainPrompt.h"

#include <utility>
#include <vector>

#include "platform/Host.h"

namespace panelglow {

namespace message = platform::message;
using platform::WindowHandle;

namespace {

constexpr std::uint32_t kTickTimer = 0;

// The flag is the process's: once a prompt was topmost, all are.
bool IsTopmostFromNowOn(unsigned int style) {
  bool& topmost = ThePromptState().topmost;
  topmost = topmost || (style & kPromptTopmost) != 0;
  return topmost;
}

std::uint32_t EventOf(std::uintptr_t change) {
  switch (change) {
    case platform::device_event::kNodesChanged:
      return kDeviceTreeChanged;
    case platform::device_event::kArrival:
      return kDeviceArrived;
    case platform::device_event::kRemoveComplete:
      return kDeviceRemoved;
    default:
      return 0;
  }
}

}  // namespace

int ImagePrompt(const wstring& text, const wstring& title, unsigned int style, const wstring& imagePath,
                AutoWorker autoWorker, int autoResult) {
  ThePromptState().workerRunning = false;
  ThePromptState().workerDone = false;
  return PlainPrompt({text, title, style, true, imagePath}, std::move(autoWorker), autoResult).Run();
}

int TextPrompt(const wstring& text, const wstring& title, unsigned int style, AutoWorker autoWorker, int autoResult) {
  return PlainPrompt({text, title, style}, std::move(autoWorker), autoResult).Run();
}

int MarkedPrompt(const wstring& text, const wstring& title, unsigned int style, const wstring& greenMark,
                 const wstring& redMark) {
  PromptRequest request{text, title, style};
  request.marks = {greenMark, redMark};
  return PlainPrompt(request, nullptr, 0).Run();
}

PlainPrompt::PlainPrompt(const PromptRequest& request, AutoWorker autoWorker, int autoResult)
    : PromptWindow("PromptWindowClassName", platform::kButtonFaceColor, request),
      autoWorker_(std::move(autoWorker)),
      autoResult_(autoResult),
      topmost_(IsTopmostFromNowOn(request.style)),
      countDown_(TheDesktop(), platform::kButtonFaceColor, std::exchange(ThePromptState().timeoutSeconds, 0U)) {}

void PlainPrompt::StartTimer() {
  if (topmost_) {
    TheDesktop().SetTimer(TheWindow(), kTickTimer, CountDown::kTick_ms, nullptr);
  }
}

std::optional<std::intptr_t> PlainPrompt::HandleOwn(const platform::Message& received) {
  if (received.id == message::kDeviceChange) {
    ThePromptState().promptEvents |= EventOf(received.wParam);
  }
  return received.id == message::kPaint ? OnPaint() : std::nullopt;
}

void PlainPrompt::OnTimer() {
  ThePromptState().promptEvents |= kPromptTick;
  CheckWorker();
  if (topmost_) {
    KeepForeground();
  }
  Count();
}

// A worker that returns without being done is started again at the next tick.
void PlainPrompt::CheckWorker() {
  PromptState& state = ThePromptState();
  if (!autoWorker_ || state.workerRunning) {
    return;
  }
  if (state.workerDone) {
    End(autoResult_);
    return;
  }
  state.workerRunning = true;
  const platform::ThreadHandle thread =
      platform::TheHost().threads.Start("prompt worker", [worker = autoWorker_, &state] {
        worker(state.workerDone);
        state.workerRunning = false;
      });
  if (thread == 0) {
    state.workerRunning = false;  // tried again at the next tick
  }
}

void PlainPrompt::KeepForeground() {
  if (const std::optional<WindowHandle> intruder = Intruder()) {
    TheDesktop().AttachInput(*intruder, true);
    TheDesktop().SetForegroundWindow(TheWindow());
    TheDesktop().SetFocus(TheWindow());
    TheDesktop().AttachInput(*intruder, false);
    FocusFirstChild(true);
  }
}

// A prompt whose time is over stays when the result is 0, and has nothing to count any more.
void PlainPrompt::Count() {
  const CountDown::Step step = countDown_.Tick();
  if (step == CountDown::Step::kOver) {
    End(ThePromptState().timeoutResult);
  }
  if (step != CountDown::Step::kNothing) {
    TheDesktop().Invalidate(TheWindow());
  }
}

// Leaves the painting to the window when nothing is counted.
std::optional<std::intptr_t> PlainPrompt::OnPaint() {
  const std::vector<WindowHandle> former = countDown_.Controls();
  countDown_.Arrange(TheWindow(), Buttons());
  for (const WindowHandle control : former) {
    if (!countDown_.IsOn(control)) {
      PaintControl(control);  // takes the number away
    }
  }
  if (!countDown_.IsRunning()) {
    return std::nullopt;
  }
  PaintImage();
  for (const WindowHandle control : countDown_.Controls()) {
    PaintControl(control);
  }
  countDown_.Paint(*TheDesktop().BeginPaint(TheWindow()), TheWindow());
  return 0;
}

void PlainPrompt::PaintOn(platform::Canvas& canvas, WindowHandle control) const {
  if (countDown_.IsOn(control)) {
    countDown_.Paint(canvas, control);
  }
}

}  // namespace panelglow
