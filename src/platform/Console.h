// Standard output and the console's control events.
#pragma once

#include <cstdint>
#include <functional>
#include <string_view>

namespace panelglow::platform {

/// Console control types.
inline constexpr std::uint32_t kControlC = 0;
inline constexpr std::uint32_t kControlBreak = 1;

class Console {
 public:
  virtual ~Console() = default;

  /// Writes to standard output and hands the bytes on at once. A reader that has gone away is no error: a run must
  /// reach its end and put every LED back.
  virtual void Write(std::string_view bytes) = 0;

  /// For people, never for the controller: standard error.
  virtual void WriteError(std::string_view bytes) = 0;

  /// Installs the one handler of control events; it is called on a thread of the system's own with the control type.
  /// A true result stops the default action. No event ends the process by itself once a handler is installed.
  virtual void SetControlHandler(std::function<bool(std::uint32_t type)> handler) = 0;
};

}  // namespace panelglow::platform
