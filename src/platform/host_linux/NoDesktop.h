// A desktop without a display: no window can be made, and nothing waits for one.
#pragma once

#include "platform/Desktop.h"

namespace panelglow::platform::host_linux {

/// Creating a window fails; getting a message gives the quit message at
/// once, so that no message loop hangs. Everything else answers as for a window that does not exist.
class NoDesktop : public Desktop {
 public:
  int ScreenWidth() override { return 0; }
  int ScreenHeight() override { return 0; }
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
};

}  // namespace panelglow::platform::host_linux
