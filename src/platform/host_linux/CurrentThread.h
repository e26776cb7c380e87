// The thread that makes a platform call: who it is, whether it was told to end, and how it waits. Every call of this
// backend that blocks waits here, so that Threads::Terminate reaches a thread wherever it is.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>

#include "platform/host_linux/ThreadControl.h"

namespace panelglow::platform::host_linux {

class CurrentThread {
 public:
  using Deadline = std::chrono::steady_clock::time_point;

  /// Identifies the thread for the life of the process; never 0, and never given to a later thread.
  static std::uint64_t Id();

  /// From now on the thread can be told to end by `control`, until it was told so or calls Finish().
  static void Adopt(ThreadControl& control);

  /// Does what AtEnd registered. Nothing interrupts the thread any more.
  static void Finish();

  /// Throws ThreadTerminated when the thread was told to end: once, and not while another exception unwinds it.
  static void CheckEndRequest();

  /// Blocks until `fd` (-1: none) is readable or hung up, or the deadline has come; true for the former. Throws as
  /// CheckEndRequest does, also when the request comes during the wait.
  static bool Await(int fd, std::optional<Deadline> deadline);

  /// Blocks for at least `duration`; throws as Await does.
  static void SleepFor(std::chrono::milliseconds duration);

  /// Runs `action` when the thread ends, whoever started it. One action for each `key`: a further one is dropped.
  static void AtEnd(const void* key, std::function<void()> action);

  /// Runs `action` once, when a thread of the process is next about to block: for what only a run that takes its time
  /// needs.
  static void BeforeNextBlock(std::function<void()> action);

 private:
  struct State;
  static State& Self();
};

}  // namespace panelglow::platform::host_linux
