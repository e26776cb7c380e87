#include "platform/sim/base/Scheduler.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <limits>

#include "platform/Threads.h"

namespace panelglow::platform::sim {

namespace {

// The simulated thread that the current real thread runs.
struct CurrentThread {
  const Scheduler* scheduler = nullptr;
  ThreadId id = 0;
};
thread_local CurrentThread t_current;

// Those of the machines that exist around the present one; a machine made on a thread gives it back at its end.
thread_local std::vector<CurrentThread> t_outer;

}  // namespace

Scheduler::Scheduler(const Options& options)
    : options_(options), realStart_(std::chrono::steady_clock::now()), random_(options.seed) {
  auto main = std::make_unique<Thread>();
  main->id = nextThread_++;
  main->name = "main";
  holder_ = main->id;
  t_outer.push_back(t_current);
  t_current = {this, main->id};
  threads_.emplace(main->id, std::move(main));
}

Scheduler::~Scheduler() {  // NOLINT(bugprone-exception-escape)
  EndThreads();
  ReapEnded();
  t_current = t_outer.back();
  t_outer.pop_back();
}

void Scheduler::EndThreads() {
  std::vector<ThreadId> alive;
  for (const auto& [id, thread] : threads_) {
    if (id != Current() && thread->state != State::kEnded) {
      alive.push_back(id);
    }
  }
  for (const ThreadId id : alive) {
    Terminate(id);
  }
}

ThreadId Scheduler::Current() const { return t_current.scheduler == this ? t_current.id : 0; }

Scheduler::Thread* Scheduler::Find(ThreadId thread) const {
  const auto found = threads_.find(thread);
  return found == threads_.end() ? nullptr : found->second.get();
}

Scheduler::Thread& Scheduler::Self() {
  Thread* self = Find(Current());
  if (self == nullptr) {
    std::fputs("simulation: a thread that the machine does not know made a platform call\n", stderr);
    std::abort();
  }
  return *self;
}

std::uint32_t Scheduler::Random(std::uint32_t bound) {
  return bound == 0 ? 0 : static_cast<std::uint32_t>(random_() % bound);
}

void Scheduler::Spend(Microseconds duration) {
  Thread& self = Self();
  self.state = State::kReady;
  self.wake = now_ + duration;
  HandOver(self);
}

void Scheduler::Block(WaitKey key, std::string what, std::optional<Microseconds> deadline) {
  Thread& self = Self();
  self.state = State::kBlocked;
  self.key = key;
  self.waitsFor = std::move(what);
  self.deadline = deadline;
  if (self.terminate && !self.unwinding) {
    self.state = State::kReady;
    self.wake = now_;
  }
  HandOver(self);
}

void Scheduler::Wake(WaitKey key) {
  for (const auto& [id, thread] : threads_) {
    if (thread->state == State::kBlocked && thread->key == key) {
      thread->state = State::kReady;
      thread->wake = now_;
    }
  }
}

void Scheduler::At(Microseconds when, std::function<void()> action) {
  events_.emplace(std::max(when, now_), std::move(action));
}

void Scheduler::ReapEnded() {
  for (const auto& [id, thread] : threads_) {
    if (id != Current() && thread->state == State::kEnded && thread->thread.joinable()) {
      thread->thread.join();  // it has handed the baton on: nothing keeps it
    }
  }
}

ThreadId Scheduler::Start(const std::string& name, std::function<void()> body) {
  ReapEnded();
  auto owned = std::make_unique<Thread>();
  Thread& thread = *owned;
  thread.id = nextThread_++;
  thread.name = name;
  thread.wake = now_;
  threads_.emplace(thread.id, std::move(owned));
  thread.thread = std::thread([this, &thread, body = std::move(body)] { RunThread(thread, body); });
  return thread.id;
}

void Scheduler::RunThread(Thread& self, const std::function<void()>& body) {
  t_current = {this, self.id};
  AwaitBaton(self);
  try {
    if (!self.terminate) {
      body();
    }
  } catch (const ThreadTerminated&) {
    // the end that Terminate asked for
  } catch (const std::exception& error) {
    std::fprintf(stderr, "simulation: thread \"%s\" ended by an exception: %s\n", self.name.c_str(), error.what());
  } catch (...) {
    std::fprintf(stderr, "simulation: thread \"%s\" ended by an exception\n", self.name.c_str());
  }
  self.unwinding = true;  // from here on nothing interrupts it any more
  if (onThreadEnd_) {
    onThreadEnd_(self.id);
  }
  self.state = State::kEnded;
  Wake(&self);
  PassBatonTo(*Choose());
}

bool Scheduler::HasEnded(ThreadId thread) const {
  const Thread* found = Find(thread);
  return found == nullptr || found->state == State::kEnded;
}

bool Scheduler::WaitForEnd(ThreadId thread, std::optional<Microseconds> deadline) {
  Thread* target = Find(thread);
  while (target != nullptr && target->state != State::kEnded) {
    if (deadline && now_ >= *deadline) {
      return false;
    }
    Block(target, "the end of thread \"" + target->name + "\"", deadline);
  }
  return true;
}

void Scheduler::Terminate(ThreadId thread) {
  Thread* target = Find(thread);
  if (target == nullptr || target->state == State::kEnded) {
    return;
  }
  target->terminate = true;
  if (!target->unwinding) {
    target->state = State::kReady;
    target->wake = now_;
  }
  WaitForEnd(thread, std::nullopt);
}

void Scheduler::HandOver(Thread& self) {
  if (onHandOver_) {
    onHandOver_();
  }
  Thread* next = Choose();
  if (next != &self) {
    PassBatonTo(*next);
    AwaitBaton(self);
  }
  if (self.terminate && !self.unwinding) {
    self.unwinding = true;
    throw ThreadTerminated{};
  }
}

// The thread that runs next; time has reached its wake time when this returns.
Scheduler::Thread* Scheduler::Choose() {
  for (;;) {
    Microseconds earliest = std::numeric_limits<Microseconds>::max();
    std::vector<Thread*>& candidates = candidates_;
    candidates.clear();
    for (const auto& [id, thread] : threads_) {
      Microseconds due = 0;
      if (thread->state == State::kReady) {
        due = std::max(thread->wake, now_);
      } else if (thread->state == State::kBlocked && thread->deadline) {
        due = std::max(*thread->deadline, now_);
      } else {
        continue;
      }
      if (due < earliest) {
        earliest = due;
        candidates.clear();
      }
      if (due == earliest) {
        candidates.push_back(thread.get());
      }
    }
    if (!events_.empty() && events_.begin()->first <= earliest) {
      AdvanceTo(std::max(events_.begin()->first, now_));
      const std::function<void()> action = std::move(events_.begin()->second);
      events_.erase(events_.begin());
      action();
      continue;
    }
    if (candidates.empty()) {
      Stuck("deadlock: no thread can ever run again");
    }
    AdvanceTo(earliest);
    Thread* next = candidates.size() == 1 ? candidates.front()
                                          : candidates[Random(static_cast<std::uint32_t>(candidates.size()))];
    next->state = State::kReady;
    next->wake = now_;
    next->deadline.reset();
    next->key = nullptr;
    return next;
  }
}

void Scheduler::AdvanceTo(Microseconds when) {
  if (options_.timeLimit_us != 0 && when > options_.timeLimit_us) {
    Stuck("the run did not end within " + std::to_string(options_.timeLimit_us / 1'000'000) + " s of virtual time");
  }
  if (options_.realTime && when > now_) {
    std::this_thread::sleep_until(realStart_ + std::chrono::microseconds(when));
  }
  now_ = std::max(now_, when);
}

void Scheduler::PassBatonTo(Thread& next) {
  const std::lock_guard<std::mutex> lock(handOver_);
  holder_ = next.id;
  next.turn.notify_one();
}

void Scheduler::AwaitBaton(Thread& self) {
  std::unique_lock<std::mutex> lock(handOver_);
  self.turn.wait(lock, [&] { return holder_ == self.id; });
}

std::string Scheduler::Describe() const {
  std::string text;
  for (const auto& [id, thread] : threads_) {
    if (thread->state == State::kEnded) {
      continue;
    }
    text += "  thread \"" + thread->name + "\" ";
    text += thread->state == State::kBlocked ? "waits for " + thread->waitsFor : std::string("is ready");
    text += "\n";
  }
  return text;
}

void Scheduler::Stuck(const std::string& reason) {
  const std::string text = "simulation: " + reason + " (at " + std::to_string(now_ / 1000) + " ms)\n" + Describe();
  if (onStuck_) {
    onStuck_(text);
  }
  std::fputs(text.c_str(), stderr);
  std::fflush(nullptr);
  std::_Exit(3);
}

}  // namespace panelglow::platform::sim
