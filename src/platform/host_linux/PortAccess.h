// I/O ports by the processor's own instructions, each access in its own width.
//
// The right to them belongs to a thread and to those that it starts later; a thread that ran before is killed by its
// first instruction. So each thread asks for it by itself, before its first access.
#pragma once

#include <cstdint>

namespace panelglow::platform::host_linux {

class PortAccess {
 public:
  /// Asks the kernel for the calling thread. 0, or the kernel's error number. A second call costs nothing.
  static int Allow();

  /// `width` is 1, 2 or 4 bytes; only after Allow on this thread.
  static std::uint32_t In(std::uint16_t port, unsigned width);
  static void Out(std::uint16_t port, unsigned width, std::uint32_t value);
};

}  // namespace panelglow::platform::host_linux
