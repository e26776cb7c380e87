// The window logic of every backend: classes, windows, message queues, timers, controls, focus, dialog keys. It draws
// nothing itself: a window keeps the operations of its last painting, and MakeScene() gives the whole picture.
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/Scene.h"
#include "platform/desktop/Screen.h"
#include "platform/desktop/WindowHost.h"

namespace panelglow::platform::desktop {

class WindowSystem : public Desktop {
 public:
  /// What ForegroundWindow() names while another program's window has the foreground.
  static constexpr WindowHandle kForeignWindow = 0xFFFFFFFF;

  /// A screen without pixels is no screen: no window can be made on it, and every message loop ends at once.
  WindowSystem(WindowHost& host, int screenWidth, int screenHeight);
  ~WindowSystem() override;

  // ---- Desktop
  int ScreenWidth() override { return screenWidth_; }
  int ScreenHeight() override { return screenHeight_; }
  bool RegisterWindowClass(const WindowClass& windowClass) override;
  void UnregisterWindowClass(std::string_view name) override;
  WindowHandle CreateWindow(const WindowRequest& request) override;
  void DestroyWindow(WindowHandle window) override;
  bool IsWindow(WindowHandle window) override { return Find(window) != nullptr; }
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
  WindowHandle ForegroundWindow() override { return foreign_ ? kForeignWindow : foreground_; }
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

  // ---- the screen's side: what comes in from mouse and keyboard, and what is to be seen

  /// What a screen says has happened, by one of the calls below.
  void Take(const ScreenEvent& event);

  /// A press and release of the left mouse button at a point of the screen. It reaches the window that is there when
  /// its thread takes the message, not the one that is there now.
  void Click(int x, int y);

  /// The left mouse button going down or up, and the mouse moving, at a point of the screen. While the button is down
  /// everything goes to the window that it went down on.
  void MouseButton(int x, int y, bool down);
  void MouseMove(int x, int y);

  /// A key going down, by its code in Keys.h; `character` is what it types, 0 for none. `alt`: with the Alt key.
  /// `repeat`: it was down already, and is held.
  void KeyDown(std::uint32_t virtualKey, char16_t character, bool alt, bool repeat);
  void KeyUp(std::uint32_t virtualKey, bool alt);

  /// A key that is pressed and released.
  void Key(std::uint32_t virtualKey, char16_t character, bool alt);

  /// A window of another program has taken the keyboard, or stands above ours. It is the foreground window until one
  /// of ours takes the foreground back.
  void LoseForeground(std::u16string_view title);

  /// The screen is gone: every message loop ends, and no window can be made any more.
  void LoseScreen();

  /// Visible top-level windows, topmost last.
  [[nodiscard]] std::vector<WindowHandle> TopLevelWindows() const;

  /// The window's frame on the screen.
  [[nodiscard]] Rectangle ScreenRectangle(WindowHandle window) const;

  [[nodiscard]] Scene MakeScene() const;

  /// Grows whenever the scene changes.
  [[nodiscard]] std::uint64_t Revision() const { return revision_; }

  /// Posts a message to every top-level window, as the system does when a device comes or goes.
  void Broadcast(std::uint32_t id, std::uintptr_t wParam);

  /// Destroys the windows that the calling thread, which is about to end, still owns.
  void EndThread();

  /// Supplies text measuring and image sizes; null until something needs it.
  void SetDrawing(std::function<SceneDrawing*()> drawing) { drawing_ = std::move(drawing); }

 private:
  struct Window;
  struct Queue;
  struct Timer {
    WindowHandle window = 0;
    std::uint32_t id = 0;
    std::uint32_t period_ms = 0;
    std::uint64_t due_ms = 0;
    TimerProcedure procedure;
  };
  struct SentMessage {
    Message message;
    std::intptr_t result = 0;
    bool done = false;
  };
  class PaintCanvas;

  [[nodiscard]] bool HasScreen() const { return screenWidth_ > 0; }
  [[nodiscard]] Window* Find(WindowHandle window) const;
  Queue& QueueOf(std::uint32_t thread);
  Queue& OwnQueue() { return QueueOf(host_.CurrentThread()); }
  std::intptr_t Call(const Message& message);
  void HandleSentMessages(Queue& queue);
  bool TakeInput(Queue& queue, Message& message);
  bool TakeKey(Queue& queue, const ScreenEvent& input, Message& message);
  bool TakeMouse(const ScreenEvent& input, Message& message);
  void PushMouse(ScreenEvent::Kind kind, int x, int y);
  void PushKey(const ScreenEvent& input);
  bool TakeTimer(Queue& queue, Message& message);
  bool TakePaint(std::uint32_t thread, Message& message);
  void Activate(WindowHandle window);
  void Raise(WindowHandle window, ZOrder order);
  [[nodiscard]] WindowHandle TopLevelOf(WindowHandle window) const;
  [[nodiscard]] bool IsDescendant(WindowHandle ancestor, WindowHandle window) const;
  [[nodiscard]] WindowHandle WindowAt(int x, int y) const;
  [[nodiscard]] bool IsShown(const Window& window) const;
  std::intptr_t ControlProcedure(const Message& message);
  void OnControlDown(WindowHandle control, int x, int y);
  void OnControlMove(WindowHandle control, int x, int y);
  void OnControlUp(WindowHandle control, int x, int y);
  void OnScrollBarDown(WindowHandle bar, int x, int y);
  void RepeatScroll(WindowHandle bar, std::uint32_t delay_ms);
  void OnButtonKey(WindowHandle button, const Message& message);
  void OnEditKey(WindowHandle edit, std::uintptr_t virtualKey);
  void OnEditCharacter(WindowHandle edit, char16_t character);
  void SendScroll(WindowHandle bar, std::uint32_t request, int position);
  [[nodiscard]] int FrameEdgesAt(const Window& window, int x, int y) const;
  void DragFrame(int x, int y);
  void Changed() { ++revision_; }
  void PressButton(WindowHandle button);
  void FocusNext(WindowHandle dialog, bool backwards);
  void FocusInGroup(WindowHandle dialog, bool backwards);
  bool PressMnemonic(WindowHandle dialog, char16_t letter);
  [[nodiscard]] WindowHandle DefaultButton(WindowHandle dialog) const;
  [[nodiscard]] bool HasHeavyFrame(const Window& button) const;
  void SendSize(WindowHandle window);
  void AskForColor(WindowHandle control);
  [[nodiscard]] Rectangle ClientOnScreen(const Window& window) const;
  void AddToScene(Scene& scene, const Window& window, const Rectangle& clip) const;

  WindowHost& host_;
  int screenWidth_;
  int screenHeight_;
  std::map<std::string, std::shared_ptr<const WindowClass>, std::less<>> classes_;
  std::map<WindowHandle, std::unique_ptr<Window>> windows_;
  std::vector<WindowHandle> order_;  // top-level windows, bottom-most first
  std::map<std::uint32_t, std::unique_ptr<Queue>> queues_;
  WindowHandle nextWindow_ = 1;
  WindowHandle foreground_ = 0;
  std::optional<std::u16string> foreign_;  // title of another program's window that has the foreground
  std::uint64_t foregroundRequests_ = 0;
  std::string language_;
  std::uint64_t revision_ = 0;

  // While the mouse button is down.
  bool mouseDown_ = false;
  std::uint32_t mouseThread_ = 0;
  WindowHandle captured_ = 0;  // where it went down
  int dragEdges_ = 0;          // edges of the captured window's frame that are dragged
  int dragX_ = 0;  // last place of a drag; of a scroll thumb the grip within it, else the mouse on the bar
  int dragY_ = 0;
  std::function<SceneDrawing*()> drawing_;
};

}  // namespace panelglow::platform::desktop
