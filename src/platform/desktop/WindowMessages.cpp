// Focus and foreground, timers, and the messages of a thread: what comes first when several wait.
#include <algorithm>
#include <utility>

#include "platform/desktop/WindowRecords.h"

namespace panelglow::platform::desktop {

namespace {

constexpr std::uint32_t kShortestTimer_ms = 10;

}  // namespace

// ---- focus and order

void WindowSystem::SetFocus(WindowHandle handle) {
  Queue& queue = OwnQueue();
  const Window* window = Find(handle);
  if (queue.focus == handle || (handle != 0 && (window == nullptr || !window->enabled))) {
    return;
  }
  if (handle != 0) {
    Activate(TopLevelOf(handle));
    if (queue.focus == handle) {
      return;
    }
  }
  const WindowHandle loser = std::exchange(queue.focus, handle);
  Changed();
  if (loser != 0) {
    Call({loser, message::kKillFocus, handle, 0});
  }
  if (handle != 0 && queue.focus == handle) {
    Call({handle, message::kSetFocus, loser, 0});
  }
}

WindowHandle WindowSystem::Focus() { return OwnQueue().focus; }

void WindowSystem::Activate(WindowHandle handle) {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return;
  }
  Queue& queue = QueueOf(window->thread);
  if (queue.active == handle) {
    return;
  }
  const WindowHandle former = std::exchange(queue.active, handle);
  if (former != 0) {
    Call({former, message::kActivate, 0, 0});
  }
  Send({handle, message::kActivate, 1, 0});
}

bool WindowSystem::SetForegroundWindow(WindowHandle handle) {
  host_.Spend();
  const Window* window = Find(handle);
  if (window == nullptr || window->parent != 0) {
    return false;
  }
  const std::vector<WindowHandle> before = order_;
  Raise(handle, ZOrder::kTop);
  if (foreground_ != handle || order_ != before || foreign_) {
    foreground_ = handle;
    foreign_.reset();
    ++foregroundRequests_;
    Changed();
  }
  if (window->thread == host_.CurrentThread()) {
    Activate(handle);
  }
  return true;
}

void WindowSystem::SetActiveWindow(WindowHandle handle) { Activate(handle); }

void WindowSystem::SetLanguage(std::string_view locale) {
  if (language_ != locale) {
    language_ = locale;
    Changed();
  }
}

void WindowSystem::LoseForeground(std::u16string_view title) {
  if (foreground_ != 0) {
    foreign_ = title;
  }
}

void WindowSystem::LoseScreen() {
  screenWidth_ = 0;
  screenHeight_ = 0;
  for (const auto& [thread, queue] : queues_) {
    host_.Wake(queue.get());
  }
}

void WindowSystem::AttachInput(WindowHandle /*other*/, bool /*attach*/) {
  // The foreground is never refused here, so there is nothing to share.
}

// ---- timers

std::uint32_t WindowSystem::SetTimer(WindowHandle handle, std::uint32_t timer, std::uint32_t period_ms,
                                     TimerProcedure procedure) {
  const Window* window = Find(handle);
  if (window == nullptr) {
    return 0;
  }
  KillTimer(handle, timer);
  const std::uint32_t period = std::max(period_ms, kShortestTimer_ms);
  QueueOf(window->thread).timers.push_back({handle, timer, period, host_.Now_ms() + period, std::move(procedure)});
  return timer;
}

void WindowSystem::KillTimer(WindowHandle handle, std::uint32_t timer) {
  if (const Window* window = Find(handle)) {
    std::erase_if(QueueOf(window->thread).timers,
                  [&](const Timer& t) { return t.window == handle && t.id == timer; });
  }
}

// ---- messages

// Runs a window's procedure on the calling thread.
std::intptr_t WindowSystem::Call(const Message& message) {
  const Window* window = Find(message.window);
  if (window == nullptr || !window->procedure) {
    return 0;
  }
  const WindowProcedure procedure = window->procedure;  // the window may end itself while it runs
  std::intptr_t result = 0;
  host_.RunProcedure([&] { result = procedure(message); });
  return result;
}

std::intptr_t WindowSystem::Send(const Message& message) {
  const Window* window = Find(message.window);
  if (window == nullptr) {
    return 0;
  }
  if (window->thread == host_.CurrentThread()) {
    return Call(message);
  }
  Queue& queue = QueueOf(window->thread);
  auto sent = std::make_shared<SentMessage>();
  sent->message = message;
  queue.sent.push_back(sent);
  host_.Wake(&queue);
  while (!sent->done && Find(message.window) != nullptr) {
    host_.Block(sent.get(), "the answer to a sent message", host_.Now_ms() + 100);
  }
  return sent->result;
}

void WindowSystem::HandleSentMessages(Queue& queue) {
  while (!queue.sent.empty()) {
    const std::shared_ptr<SentMessage> sent = queue.sent.front();
    queue.sent.pop_front();
    sent->result = Call(sent->message);
    sent->done = true;
    host_.Wake(sent.get());
  }
}

void WindowSystem::Post(const Message& message) {
  if (const Window* window = Find(message.window)) {
    Queue& queue = QueueOf(window->thread);
    queue.posted.push_back(message);
    host_.Wake(&queue);
  }
}

void WindowSystem::PostQuit() { OwnQueue().quit = true; }

// When several messages wait: what was sent comes first, then what was posted, input, painting, and timers last.
bool WindowSystem::GetMessage(Message& message) {
  host_.Spend();
  const std::uint32_t thread = host_.CurrentThread();
  Queue& queue = QueueOf(thread);
  for (;;) {
    HandleSentMessages(queue);
    if (!HasScreen()) {
      message = {0, message::kQuit, 0, 0};
      return false;
    }
    if (!queue.posted.empty()) {
      message = queue.posted.front();
      queue.posted.pop_front();
      return true;
    }
    if (TakeInput(queue, message)) {
      return true;
    }
    if (queue.quit) {
      queue.quit = false;
      message = {0, message::kQuit, 0, 0};
      return false;
    }
    if (TakePaint(thread, message) || TakeTimer(queue, message)) {
      return true;
    }
    std::optional<std::uint64_t> due;
    for (const Timer& timer : queue.timers) {
      due = due ? std::min(*due, timer.due_ms) : timer.due_ms;
    }
    host_.Block(&queue, "a message", due);
  }
}

bool WindowSystem::TakeTimer(Queue& queue, Message& message) {
  const std::uint64_t now = host_.Now_ms();
  Timer* first = nullptr;
  for (Timer& timer : queue.timers) {
    if (timer.due_ms <= now && (first == nullptr || timer.due_ms < first->due_ms)) {
      first = &timer;
    }
  }
  if (first == nullptr) {
    return false;
  }
  // A thread that was busy gets one tick, not the missed ones.
  first->due_ms += first->period_ms;
  if (first->due_ms <= now) {
    first->due_ms = now + first->period_ms;
  }
  message = {first->window, message::kTimer, first->id, first->procedure ? 1 : 0};
  return true;
}

bool WindowSystem::TakePaint(std::uint32_t thread, Message& message) {
  for (const auto& [handle, window] : windows_) {
    if (window->thread == thread && window->dirty && IsShown(*window)) {
      message = {handle, message::kPaint, 0, 0};
      return true;
    }
  }
  return false;
}

void WindowSystem::Translate(const Message& /*message*/) {
  // Character messages are made where the key comes in.
}

void WindowSystem::Dispatch(const Message& message) {
  const Window* window = Find(message.window);
  if (window == nullptr) {
    return;
  }
  if (message.id == message::kTimer && message.lParam != 0) {
    for (const Timer& timer : QueueOf(window->thread).timers) {
      if (timer.window == message.window && timer.id == message.wParam && timer.procedure) {
        const TimerProcedure procedure = timer.procedure;
        host_.RunProcedure([&] { procedure(message.window, static_cast<std::uint32_t>(message.wParam)); });
        return;
      }
    }
    return;
  }
  Call(message);
  if (message.id == message::kPaint) {
    if (Window* painted = Find(message.window)) {
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
      if (const Window* button = Find(DefaultButton(message.window))) {
        return kHasDefaultId | (button->id & 0xFFFF);
      }
      return 0;
    default:
      return 0;
  }
}

}  // namespace panelglow::platform::desktop
