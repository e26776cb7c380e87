#include "platform/host_linux/NoDesktop.h"

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

namespace {

class NoCanvas : public Canvas {
 public:
  void Fill(const Rectangle& /*area*/, Color /*color*/) override {}
  void DrawText(int /*x*/, int /*y*/, std::u16string_view /*text*/, const Font& /*font*/, Color /*color*/,
                std::optional<Color> /*background*/) override {}
  void DrawTextBox(const Rectangle& /*area*/, std::u16string_view /*text*/, const TextLayout& /*layout*/,
                   const Font& /*font*/, Color /*color*/, std::optional<Color> /*background*/) override {}
  void DrawImage(int /*x*/, int /*y*/, std::u16string_view /*path*/, const Rectangle& /*clip*/) override {}
};

}  // namespace

// The two calls that a run without a display comes to.

WindowHandle NoDesktop::CreateWindow(const WindowRequest& /*request*/) {
  CurrentThread::CheckEndRequest();
  return 0;
}

bool NoDesktop::GetMessage(Message& message) {
  CurrentThread::CheckEndRequest();
  message = {0, message::kQuit, 0, 0};
  return false;
}

// A class can be registered: the failure is the window's.
bool NoDesktop::RegisterWindowClass(const WindowClass& /*windowClass*/) { return true; }
void NoDesktop::UnregisterWindowClass(std::string_view /*name*/) {}

void NoDesktop::DestroyWindow(WindowHandle /*window*/) {}
bool NoDesktop::IsWindow(WindowHandle /*window*/) { return false; }
void NoDesktop::SetWindowPosition(WindowHandle /*window*/, ZOrder /*order*/, int /*x*/, int /*y*/, int /*width*/,
                                  int /*height*/, std::uint32_t /*flags*/) {}
void NoDesktop::MoveWindow(WindowHandle /*window*/, int /*x*/, int /*y*/, int /*width*/, int /*height*/) {}
void NoDesktop::ShowWindow(WindowHandle /*window*/, bool /*visible*/) {}
void NoDesktop::EnableWindow(WindowHandle /*window*/, bool /*enabled*/) {}
bool NoDesktop::IsWindowEnabled(WindowHandle /*window*/) { return false; }
bool NoDesktop::IsWindowVisible(WindowHandle /*window*/) { return false; }
Rectangle NoDesktop::WindowRectangle(WindowHandle /*window*/) { return {}; }
Rectangle NoDesktop::ClientRectangle(WindowHandle /*window*/) { return {}; }
wstring NoDesktop::WindowText(WindowHandle /*window*/) { return {}; }
void NoDesktop::SetWindowText(WindowHandle /*window*/, std::u16string_view /*text*/) {}
void NoDesktop::SetFont(WindowHandle /*window*/, const Font& /*font*/) {}
void NoDesktop::SetIcon(WindowHandle /*window*/, std::u16string_view /*path*/) {}
void NoDesktop::SetControlId(WindowHandle /*window*/, int /*id*/) {}
int NoDesktop::ControlId(WindowHandle /*window*/) { return 0; }
void NoDesktop::SetExtraWord(WindowHandle /*window*/, std::size_t /*index*/, std::intptr_t /*value*/) {}
std::intptr_t NoDesktop::ExtraWord(WindowHandle /*window*/, std::size_t /*index*/) { return 0; }
WindowProcedure NoDesktop::SetProcedure(WindowHandle /*window*/, WindowProcedure /*procedure*/) { return {}; }
WindowHandle NoDesktop::Parent(WindowHandle /*window*/) { return 0; }
std::vector<WindowHandle> NoDesktop::Children(WindowHandle /*window*/) { return {}; }
WindowHandle NoDesktop::FindControl(WindowHandle /*parent*/, int /*id*/) { return 0; }
void NoDesktop::SetFocus(WindowHandle /*window*/) {}
WindowHandle NoDesktop::Focus() { return 0; }
bool NoDesktop::SetForegroundWindow(WindowHandle /*window*/) { return false; }
WindowHandle NoDesktop::ForegroundWindow() { return 0; }
void NoDesktop::SetActiveWindow(WindowHandle /*window*/) {}
void NoDesktop::AttachInput(WindowHandle /*other*/, bool /*attach*/) {}
std::uint32_t NoDesktop::SetTimer(WindowHandle /*window*/, std::uint32_t /*timer*/, std::uint32_t /*period_ms*/,
                                  TimerProcedure /*procedure*/) {
  return 0;
}
void NoDesktop::KillTimer(WindowHandle /*window*/, std::uint32_t /*timer*/) {}
std::intptr_t NoDesktop::Send(const Message& /*message*/) { return 0; }
void NoDesktop::Post(const Message& /*message*/) {}
bool NoDesktop::IsDialogMessage(WindowHandle /*dialog*/, const Message& /*message*/) { return false; }
void NoDesktop::Translate(const Message& /*message*/) {}
void NoDesktop::Dispatch(const Message& /*message*/) {}
std::intptr_t NoDesktop::DefaultProcedure(const Message& /*message*/) { return 0; }
void NoDesktop::PostQuit() {}
std::unique_ptr<Canvas> NoDesktop::BeginPaint(WindowHandle /*window*/) { return std::make_unique<NoCanvas>(); }
void NoDesktop::Invalidate(WindowHandle /*window*/) {}
Rectangle NoDesktop::MeasureText(std::u16string_view /*text*/, int /*width*/, const Font& /*font*/) { return {}; }
void NoDesktop::SetScroll(WindowHandle /*bar*/, const ScrollState& /*state*/) {}
ScrollState NoDesktop::Scroll(WindowHandle /*bar*/) { return {}; }

}  // namespace panelglow::platform::host_linux
