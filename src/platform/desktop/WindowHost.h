// What the window logic needs of the machine below it: who is running, what time it is, and how to wait.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

namespace panelglow::platform::desktop {

class WindowHost {
 public:
  virtual ~WindowHost() = default;

  /// Identifies the calling thread.
  virtual std::uint32_t CurrentThread() = 0;

  /// Monotonic milliseconds, without wrap.
  virtual std::uint64_t Now_ms() = 0;

  /// Blocks the calling thread until Wake(key) or until Now_ms() reaches the deadline. May return early.
  virtual void Block(const void* key, const std::string& what, std::optional<std::uint64_t> deadline_ms) = 0;
  virtual void Wake(const void* key) = 0;

  /// A platform call that costs a little time and may be interrupted.
  virtual void Spend() = 0;

  /// Runs a window's own code: a host with a lock around the window logic gives it up meanwhile.
  virtual void RunProcedure(const std::function<void()>& procedure) { procedure(); }

  /// Runs what touches the window logic from within a window's own code: takes that lock again.
  virtual void RunInside(const std::function<void()>& action) { action(); }
};

}  // namespace panelglow::platform::desktop
