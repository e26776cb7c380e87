#include "platform/desktop/MessageQueues.h"

#include <algorithm>
#include <utility>

namespace panelglow::platform::desktop {

namespace {

constexpr std::uint32_t kShortestTimer_ms = 10;

}  // namespace

// The order of messages: this is the only place that says it.
Waiting MessageQueue::First(bool paints, std::uint64_t now_ms) const {
  if (!sent_.empty()) {
    return Waiting::kSent;
  }
  if (!posted_.empty()) {
    return Waiting::kPosted;
  }
  if (!input_.empty()) {
    return Waiting::kInput;
  }
  if (quit_) {
    return Waiting::kQuit;
  }
  if (paints) {
    return Waiting::kPaint;
  }
  return NextTimer_ms().value_or(now_ms + 1) <= now_ms ? Waiting::kTimer : Waiting::kNothing;
}

std::shared_ptr<SentMessage> MessageQueue::TakeSent() {
  std::shared_ptr<SentMessage> sent = std::move(sent_.front());
  sent_.pop_front();
  return sent;
}

void MessageQueue::PostAhead(const std::vector<Message>& messages) {
  posted_.insert(posted_.begin(), messages.begin(), messages.end());
}

Message MessageQueue::TakePosted() {
  const Message message = posted_.front();
  posted_.pop_front();
  return message;
}

void MessageQueue::PostInput(const ScreenEvent& input) {
  if (input.kind == ScreenEvent::Kind::kMouseMove && !input_.empty() && input_.back().kind == input.kind) {
    input_.pop_back();
  }
  input_.push_back(input);
}

ScreenEvent MessageQueue::TakeInput() {
  ScreenEvent input = std::move(input_.front());
  input_.pop_front();
  return input;
}

void MessageQueue::SetTimer(WindowHandle window, std::uint32_t id, std::uint32_t period_ms, std::uint64_t now_ms,
                            TimerProcedure procedure) {
  KillTimer(window, id);
  const std::uint32_t period = std::max(period_ms, kShortestTimer_ms);
  timers_.push_back({window, id, period, now_ms + period, std::move(procedure)});
}

void MessageQueue::KillTimer(WindowHandle window, std::uint32_t id) {
  std::erase_if(timers_, [&](const Timer& timer) { return timer.window == window && timer.id == id; });
}

Message MessageQueue::TakeTimer(std::uint64_t now_ms) {
  Timer& first = *std::min_element(timers_.begin(), timers_.end(),
                                   [](const Timer& a, const Timer& b) { return a.due_ms < b.due_ms; });
  first.due_ms += first.period_ms;
  if (first.due_ms <= now_ms) {
    first.due_ms = now_ms + first.period_ms;
  }
  return {first.window, message::kTimer, first.id, first.procedure ? 1 : 0};
}

TimerProcedure MessageQueue::ProcedureOf(WindowHandle window, std::uintptr_t id) const {
  const auto timer = std::find_if(timers_.begin(), timers_.end(), [&](const Timer& candidate) {
    return candidate.window == window && candidate.id == id;
  });
  return timer == timers_.end() ? TimerProcedure() : timer->procedure;
}

std::optional<std::uint64_t> MessageQueue::NextTimer_ms() const {
  std::optional<std::uint64_t> next;
  for (const Timer& timer : timers_) {
    next = next ? std::min(*next, timer.due_ms) : timer.due_ms;
  }
  return next;
}

void MessageQueue::Forget(WindowHandle window) {
  std::erase_if(timers_, [&](const Timer& timer) { return timer.window == window; });
  std::erase_if(posted_, [&](const Message& message) { return message.window == window; });
}

MessageQueue& MessageQueues::Of(std::uint32_t thread) {
  std::unique_ptr<MessageQueue>& queue = queues_[thread];
  if (!queue) {
    queue = std::make_unique<MessageQueue>();
  }
  return *queue;
}

MessageQueue* MessageQueues::Find(std::uint32_t thread) const {
  const auto found = queues_.find(thread);
  return found == queues_.end() ? nullptr : found->second.get();
}

void MessageQueues::Forget(WindowHandle window) {
  for (const auto& [thread, queue] : queues_) {
    queue->Forget(window);
  }
}

}  // namespace panelglow::platform::desktop
