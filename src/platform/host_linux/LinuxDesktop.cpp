#include "platform/host_linux/LinuxDesktop.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <array>
#include <csignal>
#include <cstdio>
#include <string>
#include <system_error>
#include <thread>
#include <utility>

#include "platform/host_linux/CurrentThread.h"
#include "platform/host_linux/DeviceEvents.h"
#include "platform/posix/ModuleLoader.h"

namespace panelglow::platform::host_linux {

void LinuxDesktop::Open() {
  using Opener = desktop::Screen* (*)(std::string*);
  std::string error;
  if (const auto open =
          reinterpret_cast<Opener>(posix::LoadSymbol("panelglow-drawing", "PanelglowOpenScreen", error))) {
    screen_.reset(open(&error));
  }
  if (!screen_) {
    OpenNone(error);
    return;
  }
  windows_ = std::make_unique<desktop::WindowSystem>(host_, screen_->Width(), screen_->Height());
  windows_->SetDrawing([this] { return drawing_.Get(); });
  changed_ = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
  // The thread lives as long as the process, like this object. Signals are other threads' business.
  sigset_t all;
  sigset_t before;
  ::sigfillset(&all);
  ::pthread_sigmask(SIG_SETMASK, &all, &before);
  try {
    std::thread([this] { RunScreen(); }).detach();
  } catch (const std::system_error& failure) {
    screen_.reset();
    OpenNone(std::string("no thread for it starts: ") + failure.what());
  }
  ::pthread_sigmask(SIG_SETMASK, &before, nullptr);
}

// The first of the two sentences that people may get about the display.
void LinuxDesktop::OpenNone(const std::string& reason) {
  const std::string line = "panelglow-diags: no window can be shown, since " + reason +
                           ". Prompts are passed over and the LED test ends unanswered: start it in a session with a "
                           "display, or set DISPLAY.\n";
  std::fputs(line.c_str(), stderr);
  windows_ = std::make_unique<desktop::WindowSystem>(host_, 0, 0);
}

template <class Use>
auto LinuxDesktop::With(Use use) {
  std::call_once(once_, [this] { Open(); });
  if (!screen_) {
    const LinuxWindowHost::Guard guard(host_);
    return use(static_cast<Desktop&>(*windows_));
  }
  CurrentThread::AtEnd(this, [this] {
    const LinuxWindowHost::Guard guard(host_);
    windows_->EndThread();
    NoteChanges();
  });
  const LinuxWindowHost::Guard guard(host_);
  struct Note {
    LinuxDesktop& desktop;
    ~Note() { desktop.NoteChanges(); }
  };
  const Note note{*this};
  return use(static_cast<Desktop&>(*windows_));
}

// Tells the screen thread that there is something new to show.
void LinuxDesktop::NoteChanges() {
  const std::uint64_t revision = windows_->Revision();
  if (std::exchange(noted_, revision) != revision) {
    const std::uint64_t one = 1;
    if (::write(changed_, &one, sizeof one) < 0) {
      return;  // its counter is full: the thread is told already
    }
  }
}

void LinuxDesktop::RunScreen() {
  DeviceEvents devices;
  std::uint64_t shown = 0;
  bool isNew = false;
  while (screen_->IsAlive()) {
    std::array<pollfd, 3> watched{
        {{screen_->Descriptor(), POLLIN, 0}, {changed_, POLLIN, 0}, {devices.Descriptor(), POLLIN, 0}}};
    // Showing may have taken events off the connection that wait to be looked at.
    ::poll(watched.data(), watched.size(), isNew ? 0 : -1);
    std::uint64_t count = 0;
    if (watched[1].revents != 0 && ::read(changed_, &count, sizeof count) < 0) {
      continue;
    }
    const std::vector<desktop::ScreenEvent> events = screen_->TakeEvents();
    desktop::Scene scene;
    {
      const LinuxWindowHost::Guard guard(host_);
      for (const desktop::ScreenEvent& event : events) {
        windows_->Take(event);
      }
      for (const std::uint32_t event : devices.Take()) {
        windows_->Broadcast(message::kDeviceChange, event);
      }
      isNew = std::exchange(shown, windows_->Revision()) != windows_->Revision();
      if (isNew) {
        scene = windows_->MakeScene();
      }
    }
    if (isNew) {
      screen_->Show(scene);
    }
  }
  std::fputs(
      "panelglow-diags: the display is gone. Open windows end unanswered and the LEDs are put back: start the test "
      "again when there is a display.\n",
      stderr);
  const LinuxWindowHost::Guard guard(host_);
  windows_->LoseScreen();
}

int LinuxDesktop::ScreenWidth() {
  return With([&](Desktop& desktop) { return desktop.ScreenWidth(); });
}

int LinuxDesktop::ScreenHeight() {
  return With([&](Desktop& desktop) { return desktop.ScreenHeight(); });
}

bool LinuxDesktop::RegisterWindowClass(const WindowClass& windowClass) {
  return With([&](Desktop& desktop) { return desktop.RegisterWindowClass(windowClass); });
}

void LinuxDesktop::UnregisterWindowClass(std::string_view name) {
  return With([&](Desktop& desktop) { return desktop.UnregisterWindowClass(name); });
}

WindowHandle LinuxDesktop::CreateWindow(const WindowRequest& request) {
  return With([&](Desktop& desktop) { return desktop.CreateWindow(request); });
}

void LinuxDesktop::DestroyWindow(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.DestroyWindow(window); });
}

bool LinuxDesktop::IsWindow(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.IsWindow(window); });
}

void LinuxDesktop::SetWindowPosition(WindowHandle window, ZOrder order, int x, int y, int width, int height,
                                     std::uint32_t flags) {
  return With([&](Desktop& desktop) { return desktop.SetWindowPosition(window, order, x, y, width, height, flags); });
}

void LinuxDesktop::MoveWindow(WindowHandle window, int x, int y, int width, int height) {
  return With([&](Desktop& desktop) { return desktop.MoveWindow(window, x, y, width, height); });
}

void LinuxDesktop::ShowWindow(WindowHandle window, bool visible) {
  return With([&](Desktop& desktop) { return desktop.ShowWindow(window, visible); });
}

void LinuxDesktop::EnableWindow(WindowHandle window, bool enabled) {
  return With([&](Desktop& desktop) { return desktop.EnableWindow(window, enabled); });
}

bool LinuxDesktop::IsWindowEnabled(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.IsWindowEnabled(window); });
}

bool LinuxDesktop::IsWindowVisible(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.IsWindowVisible(window); });
}

Rectangle LinuxDesktop::WindowRectangle(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.WindowRectangle(window); });
}

Rectangle LinuxDesktop::ClientRectangle(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.ClientRectangle(window); });
}

wstring LinuxDesktop::WindowText(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.WindowText(window); });
}

void LinuxDesktop::SetWindowText(WindowHandle window, std::u16string_view text) {
  return With([&](Desktop& desktop) { return desktop.SetWindowText(window, text); });
}

void LinuxDesktop::SetFont(WindowHandle window, const Font& font) {
  return With([&](Desktop& desktop) { return desktop.SetFont(window, font); });
}

void LinuxDesktop::SetIcon(WindowHandle window, std::u16string_view path) {
  return With([&](Desktop& desktop) { return desktop.SetIcon(window, path); });
}

void LinuxDesktop::SetControlId(WindowHandle window, int id) {
  return With([&](Desktop& desktop) { return desktop.SetControlId(window, id); });
}

int LinuxDesktop::ControlId(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.ControlId(window); });
}

void LinuxDesktop::SetExtraWord(WindowHandle window, std::size_t index, std::intptr_t value) {
  return With([&](Desktop& desktop) { return desktop.SetExtraWord(window, index, value); });
}

std::intptr_t LinuxDesktop::ExtraWord(WindowHandle window, std::size_t index) {
  return With([&](Desktop& desktop) { return desktop.ExtraWord(window, index); });
}

WindowProcedure LinuxDesktop::SetProcedure(WindowHandle window, WindowProcedure procedure) {
  return With([&](Desktop& desktop) { return desktop.SetProcedure(window, std::move(procedure)); });
}

WindowHandle LinuxDesktop::Parent(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.Parent(window); });
}

std::vector<WindowHandle> LinuxDesktop::Children(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.Children(window); });
}

WindowHandle LinuxDesktop::FindControl(WindowHandle parent, int id) {
  return With([&](Desktop& desktop) { return desktop.FindControl(parent, id); });
}

void LinuxDesktop::SetFocus(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.SetFocus(window); });
}

WindowHandle LinuxDesktop::Focus() {
  return With([&](Desktop& desktop) { return desktop.Focus(); });
}

bool LinuxDesktop::SetForegroundWindow(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.SetForegroundWindow(window); });
}

WindowHandle LinuxDesktop::ForegroundWindow() {
  return With([&](Desktop& desktop) { return desktop.ForegroundWindow(); });
}

void LinuxDesktop::SetActiveWindow(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.SetActiveWindow(window); });
}

void LinuxDesktop::SetLanguage(std::string_view locale) {
  return With([&](Desktop& desktop) { return desktop.SetLanguage(locale); });
}

void LinuxDesktop::AttachInput(WindowHandle other, bool attach) {
  return With([&](Desktop& desktop) { return desktop.AttachInput(other, attach); });
}

std::uint32_t LinuxDesktop::SetTimer(WindowHandle window, std::uint32_t timer, std::uint32_t period_ms,
                                     TimerProcedure procedure) {
  return With([&](Desktop& desktop) { return desktop.SetTimer(window, timer, period_ms, std::move(procedure)); });
}

void LinuxDesktop::KillTimer(WindowHandle window, std::uint32_t timer) {
  return With([&](Desktop& desktop) { return desktop.KillTimer(window, timer); });
}

std::intptr_t LinuxDesktop::Send(const Message& message) {
  return With([&](Desktop& desktop) { return desktop.Send(message); });
}

void LinuxDesktop::Post(const Message& message) {
  return With([&](Desktop& desktop) { return desktop.Post(message); });
}

bool LinuxDesktop::GetMessage(Message& message) {
  return With([&](Desktop& desktop) { return desktop.GetMessage(message); });
}

bool LinuxDesktop::IsDialogMessage(WindowHandle dialog, const Message& message) {
  return With([&](Desktop& desktop) { return desktop.IsDialogMessage(dialog, message); });
}

void LinuxDesktop::Translate(const Message& message) {
  return With([&](Desktop& desktop) { return desktop.Translate(message); });
}

void LinuxDesktop::Dispatch(const Message& message) {
  return With([&](Desktop& desktop) { return desktop.Dispatch(message); });
}

std::intptr_t LinuxDesktop::DefaultProcedure(const Message& message) {
  return With([&](Desktop& desktop) { return desktop.DefaultProcedure(message); });
}

void LinuxDesktop::PostQuit() {
  return With([&](Desktop& desktop) { return desktop.PostQuit(); });
}

std::unique_ptr<Canvas> LinuxDesktop::BeginPaint(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.BeginPaint(window); });
}

void LinuxDesktop::Invalidate(WindowHandle window) {
  return With([&](Desktop& desktop) { return desktop.Invalidate(window); });
}

Rectangle LinuxDesktop::MeasureText(std::u16string_view text, int width, const Font& font) {
  return With([&](Desktop& desktop) { return desktop.MeasureText(text, width, font); });
}

void LinuxDesktop::SetScroll(WindowHandle bar, const ScrollState& state) {
  return With([&](Desktop& desktop) { return desktop.SetScroll(bar, state); });
}

ScrollState LinuxDesktop::Scroll(WindowHandle bar) {
  return With([&](Desktop& desktop) { return desktop.Scroll(bar); });
}

}  // namespace panelglow::platform::host_linux
