// What waits for a thread: messages that were sent and posted, what mouse and keyboard did, timers; and what of it
// comes first.
#pragma once

#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <optional>
#include <vector>

#include "platform/Desktop.h"
#include "platform/desktop/Screen.h"

namespace panelglow::platform::desktop {

/// What a thread that asks for a message gets.
enum class Waiting { kSent, kPosted, kInput, kQuit, kPaint, kTimer, kNothing };

/// A message whose sender, on another thread, waits for the answer.
struct SentMessage {
  Message message;
  std::intptr_t result = 0;
  bool done = false;
};

class MessageQueue {
 public:
  /// What comes first. `paints`: a window of the thread is to paint itself. Times are milliseconds of one clock.
  [[nodiscard]] Waiting First(bool paints, std::uint64_t now_ms) const;

  void PostSent(std::shared_ptr<SentMessage> sent) { sent_.push_back(std::move(sent)); }
  std::shared_ptr<SentMessage> TakeSent();

  void Post(const Message& message) { posted_.push_back(message); }

  /// Messages that come before all that are posted already, in their order.
  void PostAhead(const std::vector<Message>& messages);
  Message TakePosted();

  void PostQuit() { quit_ = true; }
  void TakeQuit() { quit_ = false; }

  /// Of moves of the mouse without anything between them the last one counts.
  void PostInput(const ScreenEvent& input);
  ScreenEvent TakeInput();

  /// Starts a timer, or starts it again; its first tick comes after one period.
  void SetTimer(WindowHandle window, std::uint32_t id, std::uint32_t period_ms, std::uint64_t now_ms,
                TimerProcedure procedure);
  void KillTimer(WindowHandle window, std::uint32_t id);

  /// The message of the timer that is due for the longest time. Its `lParam` is 1 when the timer has a procedure. A
  /// thread that was busy gets one tick, not the missed ones.
  Message TakeTimer(std::uint64_t now_ms);

  /// Empty for a timer that is gone.
  [[nodiscard]] TimerProcedure ProcedureOf(WindowHandle window, std::uintptr_t id) const;

  /// When the next timer is due.
  [[nodiscard]] std::optional<std::uint64_t> NextTimer_ms() const;

  /// A window is gone, and with it what was posted to it and its timers.
  void Forget(WindowHandle window);

 private:
  struct Timer {
    WindowHandle window = 0;
    std::uint32_t id = 0;
    std::uint32_t period_ms = 0;
    std::uint64_t due_ms = 0;
    TimerProcedure procedure;
  };

  std::deque<std::shared_ptr<SentMessage>> sent_;
  std::deque<Message> posted_;
  std::deque<ScreenEvent> input_;
  std::vector<Timer> timers_;
  bool quit_ = false;
};

/// A queue for every thread that has, or had, a window or asked for a message.
class MessageQueues {
 public:
  /// Made when it is first asked for; stays where it is until Remove().
  MessageQueue& Of(std::uint32_t thread);

  /// Null when the thread has none.
  [[nodiscard]] MessageQueue* Find(std::uint32_t thread) const;

  void Remove(std::uint32_t thread) { queues_.erase(thread); }
  void Forget(WindowHandle window);

  template <class Visit>
  void ForEach(Visit visit) {
    for (const auto& [thread, queue] : queues_) {
      visit(*queue);
    }
  }

 private:
  std::map<std::uint32_t, std::unique_ptr<MessageQueue>> queues_;
};

}  // namespace panelglow::platform::desktop
