// Virtual time and the one baton of a simulated machine.
//
// Simulated threads are real threads, but only the holder of the baton runs. A call that can block hands it on: the
// next runner is the one with the earliest wake time, ties broken by a seeded generator. When nobody can run, time
// jumps. The same seed gives the same run; another seed another interleaving.
#pragma once

#include <algorithm>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <random>
#include <string>
#include <thread>
#include <vector>

namespace panelglow::platform::sim {

using Microseconds = std::uint64_t;
using ThreadId = std::uint32_t;

class Scheduler {
 public:
  /// What a thread waits for: any address that waker and waiter agree on.
  using WaitKey = const void*;

  struct Options {
    std::uint64_t seed = 1;
    bool realTime = false;          // time follows the wall clock, for a person to watch
    Microseconds timeLimit_us = 0;  // 0: no limit
  };

  /// Adopts the calling thread as the first simulated thread, which holds the baton.
  explicit Scheduler(const Options& options);

  /// Ends the threads that still run by unwinding them. To be called by the adopted thread, which nobody terminates.
  ~Scheduler();  // NOLINT(bugprone-exception-escape): only memory can run out
  Scheduler(const Scheduler&) = delete;
  Scheduler& operator=(const Scheduler&) = delete;

  [[nodiscard]] Microseconds Now() const { return now_; }
  [[nodiscard]] ThreadId Current() const;

  /// The calling thread is busy for `duration`: others whose time has come run meanwhile.
  void Spend(Microseconds duration);

  void SleepFor(Microseconds duration) { Spend(duration); }

  /// Time passes with nobody running: for what silicon still does when the program's run is over.
  void PassTo(Microseconds when) { now_ = std::max(now_, when); }

  ThreadId Start(const std::string& name, std::function<void()> body);
  [[nodiscard]] bool HasEnded(ThreadId thread) const;

  /// True when the thread has ended by the deadline (none: without limit).
  bool WaitForEnd(ThreadId thread, std::optional<Microseconds> deadline);

  /// Unwinds every thread but the calling one. What they use must still be there; the destructor does it otherwise.
  void EndThreads();

  /// Gives up what the system keeps of threads that have ended. To be called by the holder of the baton.
  void ReapEnded();

  /// Unwinds the thread by ThreadTerminated and returns when it has ended.
  void Terminate(ThreadId thread);

  /// Blocks the calling thread until Wake(key) or the deadline. `what` names the thing in a deadlock report. A wake
  /// may come for another reason: the caller checks its condition again.
  void Block(WaitKey key, std::string what, std::optional<Microseconds> deadline);

  /// Makes all threads that block on `key` ready.
  void Wake(WaitKey key);

  /// Runs `action` when time reaches `when`, on whatever thread holds the baton then. It must not block.
  void At(Microseconds when, std::function<void()> action);

  /// Called on each thread as its last act, before its locks and windows are given up for good.
  void OnThreadEnd(std::function<void(ThreadId)> action) { onThreadEnd_ = std::move(action); }

  /// Asked before each hand-over; lets an outside signal enter the machine.
  void OnHandOver(std::function<void()> action) { onHandOver_ = std::move(action); }

  /// Called instead of the default end of the process (exit code 3) when no thread can ever run again, or when the
  /// time limit is passed; the text says who waits for what.
  void OnStuck(std::function<void(const std::string&)> action) { onStuck_ = std::move(action); }

  /// A number from the run's seeded generator, 0 to `bound` - 1.
  std::uint32_t Random(std::uint32_t bound);

 private:
  enum class State { kReady, kBlocked, kEnded };

  struct Thread {
    ThreadId id = 0;
    std::string name;
    State state = State::kReady;
    Microseconds wake = 0;                 // when ready
    std::optional<Microseconds> deadline;  // when blocked
    WaitKey key = nullptr;
    std::string waitsFor;
    bool terminate = false;
    bool unwinding = false;
    std::condition_variable turn;
    std::thread thread;
  };

  void HandOver(Thread& self);
  Thread* Choose();
  void AdvanceTo(Microseconds when);
  void PassBatonTo(Thread& next);
  void AwaitBaton(Thread& self);
  void RunThread(Thread& self, const std::function<void()>& body);
  void Stuck(const std::string& reason);
  [[nodiscard]] std::string Describe() const;
  Thread& Self();
  [[nodiscard]] Thread* Find(ThreadId thread) const;

  Options options_;
  Microseconds now_ = 0;
  std::chrono::steady_clock::time_point realStart_;
  std::mt19937_64 random_;
  std::map<ThreadId, std::unique_ptr<Thread>> threads_;
  std::vector<Thread*> candidates_;                            // of the choice at hand; kept for its memory
  std::multimap<Microseconds, std::function<void()>> events_;  // equal times in order of arrival
  ThreadId nextThread_ = 1;
  std::function<void(ThreadId)> onThreadEnd_;
  std::function<void()> onHandOver_;
  std::function<void(const std::string&)> onStuck_;

  std::mutex handOver_;  // guards holder_ alone; everything else belongs to the holder of the baton
  ThreadId holder_ = 0;
};

}  // namespace panelglow::platform::sim
