// Standard output and the console's control events.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace panelglow::platform {

/// Console control types that ask a run to end.
inline constexpr std::uint32_t kControlC = 0;
inline constexpr std::uint32_t kControlBreak = 1;

class Console {
 public:
  virtual ~Console() = default;

  /// Writes to standard output and hands the bytes on at once. Bytes that cannot be handed on, as to a reader that
  /// has gone away, do not stop the caller: a run must reach its end and put every LED back. OutputProblem remembers
  /// them.
  virtual void Write(std::string_view bytes) = 0;

  /// Why some bytes of Write were not handed on, in the system's words; empty while all were.
  virtual std::string OutputProblem() { return {}; }

  /// For people, never for the controller: standard error.
  virtual void WriteError(std::string_view bytes) = 0;

  /// Installs the one handler of control events; it is called on a thread of the system's own with the control type.
  /// A true result stops the default action. No event ends the process by itself once a handler is installed.
  virtual void SetControlHandler(std::function<bool(std::uint32_t type)> handler) = 0;
};

}  // namespace panelglow::platform
