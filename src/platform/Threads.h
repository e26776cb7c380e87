// Threads that can be waited for and ended from outside without breaking a lock or the heap.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

namespace panelglow::platform {

/// Names a started thread until it is closed; 0 names none.
using ThreadHandle = std::uint32_t;

/// Thrown by a platform call on a thread that was told to end; unwinds that thread to its start, so that every
/// destructor on the way runs. A `catch (...)` that may meet it has to throw it on.
struct ThreadTerminated {};

class Threads {
 public:
  static constexpr std::uint32_t kNoLimit = 0xFFFFFFFF;

  virtual ~Threads() = default;

  /// Runs `body` on a new thread; `name` appears in diagnostics only. Returns 0 when no thread can be had. An
  /// exception that leaves `body` ends the thread; it is reported on standard error.
  virtual ThreadHandle Start(const std::string& name, std::function<void()> body) = 0;

  /// Blocks until the thread has ended or `limit_ms` milliseconds are over. True: it has ended. An unknown handle
  /// counts as ended.
  virtual bool Wait(ThreadHandle thread, std::uint32_t limit_ms) = 0;

  /// Forgets the handle. The thread itself runs on.
  virtual void Close(ThreadHandle thread) = 0;

  /// Ends the thread: its current or next platform call throws ThreadTerminated there. While it unwinds, platform
  /// calls work as usual, so that a restore in a destructor is carried out. Returns when the thread has ended, or
  /// after ten seconds if it makes no platform call.
  virtual void Terminate(ThreadHandle thread) = 0;
};

}  // namespace panelglow::platform
