// The window logic of every backend: it makes and destroys windows, brings messages to them and keeps the focus, and
// joins what knows nothing of one another: the tree of windows, the queues of messages, controls, dialog keys, mouse
// and picture. It draws nothing itself: a window keeps the operations of its last painting, and MakeScene() gives the
// whole picture.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/ControlEffects.h"
#include "platform/desktop/FocusState.h"
#include "platform/desktop/MessageQueues.h"
#include "platform/desktop/MouseInput.h"
#include "platform/desktop/Scene.h"
#include "platform/desktop/Screen.h"
#include "platform/desktop/TextMeasure.h"
#include "platform/desktop/WindowHost.h"
#include "platform/desktop/WindowProperties.h"

namespace panelglow::platform::desktop {

class WindowSystem : public WindowProperties {
 public:
  /// What ForegroundWindow() names while another program's window has the foreground.
  static constexpr WindowHandle kForeignWindow = 0xFFFFFFFF;

  /// A screen without pixels is no screen: no window can be made on it, and every message loop ends at once.
  WindowSystem(WindowHost& host, int screenWidth, int screenHeight)
      : host_(host), screenWidth_(screenWidth), screenHeight_(screenHeight) {}

  // ---- Desktop
  int ScreenWidth() override { return screenWidth_; }
  int ScreenHeight() override { return screenHeight_; }
  WindowHandle CreateWindow(const WindowRequest& request) override;
  void DestroyWindow(WindowHandle window) override;
  void SetWindowPosition(WindowHandle window, ZOrder order, int x, int y, int width, int height,
                         std::uint32_t flags) override;
  void MoveWindow(WindowHandle window, int x, int y, int width, int height) override;
  void ShowWindow(WindowHandle window, bool visible) override;
  void EnableWindow(WindowHandle window, bool enabled) override;
  wstring WindowText(WindowHandle window) override;
  void SetFocus(WindowHandle window) override;
  WindowHandle Focus() override { return OwnFocus().focus; }
  bool SetForegroundWindow(WindowHandle window) override;
  WindowHandle ForegroundWindow() override { return focus_.Foreign() ? kForeignWindow : focus_.Foreground(); }
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
  void PostQuit() override { queues_.Of(host_.CurrentThread()).PostQuit(); }
  std::unique_ptr<Canvas> BeginPaint(WindowHandle window) override;
  void Invalidate(WindowHandle window) override;
  Rectangle MeasureText(std::u16string_view text, int width, const Font& font) override {
    return measure_.SizeOf(text, width, font, language_);
  }

  // ---- the screen's side: what comes in from mouse and keyboard, and what is to be seen

  /// What a screen says has happened. Mouse: it reaches the window that is there when its thread takes the message,
  /// not the one that is there now; while the button is down everything goes to the window that it went down on.
  void Take(const ScreenEvent& event);

  /// One such event, or two: the left mouse button at a point of the screen; and a key by its code in Keys.h, with
  /// what it types, 0 for nothing. `repeat`: it was down already, and is held.
  void MouseButton(int x, int y, bool down);
  void MouseMove(int x, int y);
  void Click(int x, int y);
  void KeyDown(std::uint32_t virtualKey, char16_t character, bool alt, bool repeat);
  void KeyUp(std::uint32_t virtualKey, bool alt);
  void Key(std::uint32_t virtualKey, char16_t character, bool alt);

  /// A window of another program has taken the keyboard, or stands above ours. It is the foreground window until one
  /// of ours takes the foreground back.
  void LoseForeground(std::u16string_view title);

  /// The screen is gone: every message loop ends, and no window can be made any more.
  void LoseScreen();

  [[nodiscard]] Scene MakeScene() const;

  /// Posts a message to every top-level window, as the system does when a device comes or goes.
  void Broadcast(std::uint32_t id, std::uintptr_t wParam);

  /// Destroys the windows that the calling thread, which is about to end, still owns.
  void EndThread();

  /// Supplies text measuring and image sizes; null until something needs it.
  void SetDrawing(std::function<SceneDrawing*()> drawing) { measure_.SetDrawing(std::move(drawing)); }

 private:
  [[nodiscard]] bool HasScreen() const { return screenWidth_ > 0; }
  FocusState::OfThread& OwnFocus() { return focus_.Of(host_.CurrentThread()); }
  void SendSize(WindowHandle window);
  void AskForColor(WindowHandle control);
  void Activate(WindowHandle window);
  void Raise(WindowHandle window, ZOrder order);
  std::intptr_t Call(const Message& message);
  void Answer(SentMessage& sent);
  bool TakeInput(const ScreenEvent& input, Message& message);
  bool TakeMouse(const ScreenEvent& input, Message& message);
  void DragFrame(WindowHandle window, const MouseCapture& capture, int x, int y);
  void PostInput(std::uint32_t thread, const ScreenEvent& event);
  void RunControl(const Message& message);
  void PressButton(WindowHandle button);
  void PressDefaultButton(WindowHandle dialog);

  WindowHost& host_;
  int screenWidth_;
  int screenHeight_;
  MessageQueues queues_;
  FocusState focus_;
  MouseInput mouse_;
  TextMeasure measure_;
  std::string language_;
};

}  // namespace panelglow::platform::desktop
