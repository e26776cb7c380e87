// The windows of this machine: the window logic under a lock, shown on the display that DISPLAY names. The display is
// opened, and a thread for it started, when the first thing is asked of this object; without a display every window
// fails to be made, and when the display goes away every message loop ends.
#pragma once

#include <memory>
#include <mutex>
#include <string>

#include "platform/Desktop.h"
#include "platform/desktop/Screen.h"
#include "platform/desktop/WindowSystem.h"
#include "platform/host_linux/LinuxWindowHost.h"
#include "platform/posix/LazyDrawing.h"

namespace panelglow::platform::host_linux {

class LinuxDesktop : public Desktop {
 public:
  /// `drawing` measures text.
  explicit LinuxDesktop(posix::LazyDrawing& drawing) : drawing_(drawing) {}

  int ScreenWidth() override;
  int ScreenHeight() override;
  bool RegisterWindowClass(const WindowClass& windowClass) override;
  void UnregisterWindowClass(std::string_view name) override;
  WindowHandle CreateWindow(const WindowRequest& request) override;
  void DestroyWindow(WindowHandle window) override;
  bool IsWindow(WindowHandle window) override;
  void SetWindowPosition(WindowHandle window, ZOrder order, int x, int y, int width, int height,
                         std::uint32_t flags) override;
  void MoveWindow(WindowHandle window, int x, int y, int width, int height) override;
  void ShowWindow(WindowHandle window, bool visible) override;
  void EnableWindow(WindowHandle window, bool enabled) override;
  bool IsWindowEnabled(WindowHandle window) override;
  bool IsWindowVisible(WindowHandle window) override;
  Rectangle WindowRectangle(WindowHandle window) override;
  Rectangle ClientRectangle(WindowHandle window) override;
  wstring WindowText(WindowHandle window) override;
  void SetWindowText(WindowHandle window, std::u16string_view text) override;
  void SetFont(WindowHandle window, const Font& font) override;
  void SetIcon(WindowHandle window, std::u16string_view path) override;
  void SetControlId(WindowHandle window, int id) override;
  int ControlId(WindowHandle window) override;
  void SetExtraWord(WindowHandle window, std::size_t index, std::intptr_t value) override;
  std::intptr_t ExtraWord(WindowHandle window, std::size_t index) override;
  WindowProcedure SetProcedure(WindowHandle window, WindowProcedure procedure) override;
  WindowHandle Parent(WindowHandle window) override;
  std::vector<WindowHandle> Children(WindowHandle window) override;
  WindowHandle FindControl(WindowHandle parent, int id) override;
  void SetFocus(WindowHandle window) override;
  WindowHandle Focus() override;
  bool SetForegroundWindow(WindowHandle window) override;
  WindowHandle ForegroundWindow() override;
  void SetActiveWindow(WindowHandle window) override;
  void SetLanguage(std::string_view locale) override;
  void AttachInput(WindowHandle other, bool attach) override;
  std::uint32_t SetTimer(WindowHandle window, std::uint32_t timer, std::uint32_t period_ms,
                         TimerProcedure procedure) override;
  void KillTimer(WindowHandle window, std::uint32_t timer) override;
  std::intptr_t Send(const Message& message) override;
  void Post(const Message& message) override;
  bool GetMessage(Message& message) override;
  bool IsDialogMessage(WindowHandle dialog, const Message& message) override;
  void Translate(const Message& message) override;
  void Dispatch(const Message& message) override;
  std::intptr_t DefaultProcedure(const Message& message) override;
  void PostQuit() override;
  std::unique_ptr<Canvas> BeginPaint(WindowHandle window) override;
  void Invalidate(WindowHandle window) override;
  Rectangle MeasureText(std::u16string_view text, int width, const Font& font) override;
  void SetScroll(WindowHandle bar, const ScrollState& state) override;
  ScrollState Scroll(WindowHandle bar) override;

 private:
  /// Calls `use` with the window logic under its lock.
  template <class Use>
  auto With(Use use);

  void Open();
  void RunScreen();
  void OpenNone(const std::string& reason);
  void NoteChanges();

  posix::LazyDrawing& drawing_;
  std::once_flag once_;
  LinuxWindowHost host_;
  std::unique_ptr<desktop::Screen> screen_;         // the screen thread's, once that runs; null: no display
  std::unique_ptr<desktop::WindowSystem> windows_;  // made by the first call
  int changed_ = -1;                                // event: the scene may have changed
  std::uint64_t noted_ = 0;                         // revision that the screen thread was told of; under the lock
};

}  // namespace panelglow::platform::host_linux
