// Messages on their way: from mouse, keyboard, timers and callers into the queues, out of them, and to the windows.
#include <algorithm>
#include <utility>

#include "platform/desktop/DialogKeys.h"
#include "platform/desktop/KeyMessages.h"
#include "platform/desktop/WindowSystem.h"

namespace panelglow::platform::desktop {

namespace {

constexpr std::uint32_t kControlTimer = 1;  // of a built-in control

}  // namespace

// ---- sending and posting

// Runs a window's procedure on the calling thread.
std::intptr_t WindowSystem::Call(const Message& message) {
  const Window* window = tree_.Find(message.window);
  if (window == nullptr || !window->procedure) {
    return 0;
  }
  const WindowProcedure procedure = window->procedure;  // the window may end itself while it runs
  std::intptr_t result = 0;
  host_.RunProcedure([&] { result = procedure(message); });
  return result;
}

std::intptr_t WindowSystem::Send(const Message& message) {
  const Window* window = tree_.Find(message.window);
  if (window == nullptr) {
    return 0;
  }
  if (window->thread == host_.CurrentThread()) {
    return Call(message);
  }
  MessageQueue& queue = queues_.Of(window->thread);
  auto sent = std::make_shared<SentMessage>();
  sent->message = message;
  queue.PostSent(sent);
  host_.Wake(&queue);
  while (!sent->done && IsWindow(message.window)) {
    host_.Block(sent.get(), "the answer to a sent message", host_.Now_ms() + 100);
  }
  return sent->result;
}

void WindowSystem::Answer(SentMessage& sent) {
  sent.result = Call(sent.message);
  sent.done = true;
  host_.Wake(&sent);
}

void WindowSystem::Post(const Message& message) {
  if (const Window* window = tree_.Find(message.window)) {
    MessageQueue& queue = queues_.Of(window->thread);
    queue.Post(message);
    host_.Wake(&queue);
  }
}

void WindowSystem::Broadcast(std::uint32_t id, std::uintptr_t wParam) {
  for (const WindowHandle handle : std::vector<WindowHandle>(tree_.Order())) {
    Post({handle, id, wParam, 0});
  }
}

std::uint32_t WindowSystem::SetTimer(WindowHandle handle, std::uint32_t timer, std::uint32_t period_ms,
                                     TimerProcedure procedure) {
  const Window* window = tree_.Find(handle);
  if (window == nullptr) {
    return 0;
  }
  queues_.Of(window->thread).SetTimer(handle, timer, period_ms, host_.Now_ms(), std::move(procedure));
  return timer;
}

void WindowSystem::KillTimer(WindowHandle handle, std::uint32_t timer) {
  if (const Window* window = tree_.Find(handle)) {
    queues_.Of(window->thread).KillTimer(handle, timer);
  }
}

// ---- taking

bool WindowSystem::GetMessage(Message& message) {
  host_.Spend();
  const std::uint32_t thread = host_.CurrentThread();
  MessageQueue& queue = queues_.Of(thread);
  for (;;) {
    const std::uint64_t now_ms = host_.Now_ms();
    const WindowHandle toPaint = tree_.ToPaint(thread);
    Waiting first = queue.First(toPaint != 0, now_ms);
    if (!HasScreen() && first != Waiting::kSent) {
      first = Waiting::kQuit;
    }
    switch (first) {
      case Waiting::kSent:
        Answer(*queue.TakeSent());
        break;
      case Waiting::kPosted:
        message = queue.TakePosted();
        return true;
      case Waiting::kInput:
        if (TakeInput(queue.TakeInput(), message)) {
          return true;
        }
        break;
      case Waiting::kQuit:
        queue.TakeQuit();
        message = {0, message::kQuit, 0, 0};
        return false;
      case Waiting::kPaint:
        message = {toPaint, message::kPaint, 0, 0};
        return true;
      case Waiting::kTimer:
        message = queue.TakeTimer(now_ms);
        return true;
      case Waiting::kNothing:
        host_.Block(&queue, "a message", queue.NextTimer_ms());
        break;
    }
  }
}

// False when the input makes no message: nobody has the keyboard, or the mouse drags a frame.
bool WindowSystem::TakeInput(const ScreenEvent& input, Message& message) {
  if (IsMouse(input)) {
    return TakeMouse(input, message);
  }
  const WindowHandle target = OwnFocus().KeyTarget();
  std::vector<Message> messages = KeyMessages(target, input);
  if (target == 0 || messages.empty()) {
    return false;
  }
  message = messages.front();
  messages.erase(messages.begin());
  queues_.Of(host_.CurrentThread()).PostAhead(messages);
  return true;
}

bool WindowSystem::TakeMouse(const ScreenEvent& input, Message& message) {
  const std::uint32_t thread = host_.CurrentThread();
  MouseCapture& capture = mouse_.CaptureOf(thread);
  if (input.kind == ScreenEvent::Kind::kMouseDown) {
    const WindowHandle hit = tree_.At(input.x, input.y);
    const Window* window = tree_.Find(hit);
    const bool hasEdges = window != nullptr && (window->style & style::kSizeFrame) != 0;
    const int edges = hasEdges ? EdgesAt(tree_.FrameOnScreen(hit), tree_.ClientOnScreen(hit), input.x, input.y) : 0;
    capture.Begin(hit, WindowRectangle(hit), edges, input.x, input.y);
    if (window != nullptr) {
      SetForegroundWindow(tree_.TopLevelOf(hit));
    }
  }
  const WindowHandle target = capture.TargetOf(input.kind);
  const Window* window = tree_.Find(target);
  if (window == nullptr || window->thread != thread) {
    return false;
  }
  if (capture.IsDragging()) {
    if (input.kind == ScreenEvent::Kind::kMouseMove) {
      DragFrame(target, capture, input.x, input.y);
    }
    return false;
  }
  message = MouseMessage(target, tree_.FrameOnScreen(target), input);
  return true;
}

void WindowSystem::DragFrame(WindowHandle window, const MouseCapture& capture, int x, int y) {
  const Rectangle wanted = capture.DraggedTo(x, y);
  MoveWindow(window, wanted.left, wanted.top, wanted.Width(), wanted.Height());
  const Rectangle now = WindowRectangle(window);
  const Rectangle anchored = capture.Anchored(now.Width(), now.Height());
  MoveWindow(window, anchored.left, anchored.top, anchored.Width(), anchored.Height());
}

// ---- handling

bool WindowSystem::IsDialogMessage(WindowHandle dialog, const Message& message) {
  if (!IsWindow(dialog) || !tree_.IsDescendant(dialog, message.window)) {
    return false;
  }
  const std::optional<DialogAction> action = ActionOf(tree_, dialog, Focus(), message);
  if (!action) {
    Translate(message);
    Dispatch(message);
    return true;
  }
  if (action->focus != 0) {
    SetFocus(action->focus);
    if (const Window* entered = tree_.Find(action->focus); entered != nullptr && entered->kind == WindowKind::kEdit) {
      Send({action->focus, message::kSelectAll, 0, 0});
    }
  }
  if (action->press != 0) {
    PressButton(action->press);
  }
  if (action->pressDefault) {
    PressDefaultButton(dialog);
  }
  if (action->command != 0) {
    Send({dialog, message::kCommand, action->command, 0});
  }
  return true;
}

void WindowSystem::PressDefaultButton(WindowHandle dialog) {
  const std::intptr_t answer = Send({dialog, message::kGetDefaultId, 0, 0});
  const WindowHandle button = FindControl(dialog, static_cast<int>(answer & 0xFFFF));
  if ((answer & ~std::intptr_t{0xFFFF}) == kHasDefaultId && button != 0) {
    PressButton(button);
  } else {
    Send({dialog, message::kCommand, kOkCommand, 0});
  }
}

void WindowSystem::PressButton(WindowHandle button) {
  const Window* window = tree_.Find(button);
  if (window != nullptr && window->enabled) {
    Send({window->parent, message::kCommand, static_cast<std::uintptr_t>(window->id) & 0xFFFFU,
          static_cast<std::intptr_t>(button)});
  }
}

void WindowSystem::Translate(const Message& /*message*/) {
  // Character messages are made where the key comes in.
}

void WindowSystem::Dispatch(const Message& message) {
  const Window* window = tree_.Find(message.window);
  if (window == nullptr) {
    return;
  }
  if (message.id == message::kTimer && message.lParam != 0) {
    const TimerProcedure procedure = queues_.Of(window->thread).ProcedureOf(message.window, message.wParam);
    if (procedure) {
      host_.RunProcedure([&] { procedure(message.window, static_cast<std::uint32_t>(message.wParam)); });
    }
    return;
  }
  Call(message);
  if (message.id == message::kPaint) {
    if (Window* painted = tree_.Find(message.window)) {
      painted->dirty = false;  // a procedure that did not paint is not asked again and again
    }
  }
}

std::intptr_t WindowSystem::DefaultProcedure(const Message& message) {
  switch (message.id) {
    case message::kClose:
      DestroyWindow(message.window);
      return 0;
    case message::kActivate:
      if (message.wParam != 0) {
        SetFocus(message.window);
      }
      return 0;
    case message::kPaint:
      BeginPaint(message.window);
      return 0;
    case message::kGetDefaultId:
      if (const Window* button = tree_.Find(DefaultButton(tree_, message.window))) {
        return kHasDefaultId | (button->id & 0xFFFF);
      }
      return 0;
    default:
      return 0;
  }
}

// A built-in control's procedure: the control says what is to be done, and each step may destroy it.
void WindowSystem::RunControl(const Message& message) {
  const WindowHandle control = message.window;
  Window* window = tree_.Find(control);
  if (window == nullptr) {
    return;
  }
  const ControlEffects effects = HandleByControl(*window, message);
  const bool vertical = (window->style & style::kScrollBarVertical) != 0;
  const WindowHandle parent = window->parent;
  if (effects.changed) {
    Changed();
  }
  if (effects.takesFocus) {
    SetFocus(control);
  }
  if (effects.timer_ms == 0U) {
    KillTimer(control, kControlTimer);
  } else if (effects.timer_ms) {
    SetTimer(control, kControlTimer, *effects.timer_ms, nullptr);
  }
  if (effects.pressed) {
    PressButton(control);
  }
  for (const std::uintptr_t word : effects.scrollWords) {
    Send({parent, vertical ? message::kVerticalScroll : message::kHorizontalScroll, word,
          static_cast<std::intptr_t>(control)});
  }
}

// ---- the screen's side

void WindowSystem::Take(const ScreenEvent& event) {
  if (event.kind == ScreenEvent::Kind::kForegroundLost) {
    LoseForeground(event.title);
  } else if (!IsMouse(event)) {
    if (const Window* window = tree_.Find(focus_.Foreground())) {
      PostInput(window->thread, event);
    }
  } else {
    const Window* window = tree_.Find(tree_.At(event.x, event.y));
    if (mouse_.Note(event.kind, window == nullptr ? 0 : window->thread)) {
      PostInput(mouse_.Thread(), event);
    }
  }
}

void WindowSystem::PostInput(std::uint32_t thread, const ScreenEvent& event) {
  if (MessageQueue* queue = queues_.Find(thread)) {
    queue->PostInput(event);
    host_.Wake(queue);
  }
}

void WindowSystem::MouseButton(int x, int y, bool down) {
  Take(MouseEvent(down ? ScreenEvent::Kind::kMouseDown : ScreenEvent::Kind::kMouseUp, x, y));
}

void WindowSystem::MouseMove(int x, int y) { Take(MouseEvent(ScreenEvent::Kind::kMouseMove, x, y)); }

void WindowSystem::Click(int x, int y) {
  MouseButton(x, y, true);
  MouseButton(x, y, false);
}

void WindowSystem::KeyDown(std::uint32_t virtualKey, char16_t character, bool alt, bool repeat) {
  ScreenEvent event;
  event.virtualKey = virtualKey;
  event.character = character;
  event.alt = alt;
  event.repeat = repeat;
  Take(event);
}

void WindowSystem::KeyUp(std::uint32_t virtualKey, bool alt) {
  ScreenEvent event;
  event.kind = ScreenEvent::Kind::kKeyUp;
  event.virtualKey = virtualKey;
  event.alt = alt;
  Take(event);
}

void WindowSystem::Key(std::uint32_t virtualKey, char16_t character, bool alt) {
  KeyDown(virtualKey, character, alt, false);
  KeyUp(virtualKey, alt);
}

}  // namespace panelglow::platform::desktop
