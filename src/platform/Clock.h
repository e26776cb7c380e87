// The only source of time in the program.
#pragma once

#include <cstdint>
#include <ctime>

namespace panelglow::platform {

class Clock {
 public:
  virtual ~Clock() = default;

  /// Milliseconds of a monotonic counter. Wraps after about 49.7 days: subtract as unsigned 32-bit values.
  virtual std::uint32_t TickCount() = 0;

  /// Seconds since 1970-01-01 00:00 UTC.
  virtual std::time_t WallTime() = 0;

  /// Broken-down local time of `seconds`.
  virtual std::tm LocalTime(std::time_t seconds) = 0;

  /// Blocks the calling thread for at least `milliseconds`. Unwinds the thread by ThreadTerminated when it was
  /// told to end (see Threads::Terminate).
  virtual void Sleep(std::uint32_t milliseconds) = 0;
};

}  // namespace panelglow::platform
