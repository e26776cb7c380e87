#include "platform/host_linux/PortAccess.h"

#include <cerrno>

#if defined(__x86_64__) || defined(__i386__)
#include <sys/io.h>
#endif

namespace panelglow::platform::host_linux {

#if defined(__x86_64__) || defined(__i386__)

int PortAccess::Allow() {
  constexpr int kAllPorts = 3;
  thread_local bool isAllowed = false;
  if (!isAllowed && ::iopl(kAllPorts) != 0) {
    return errno;
  }
  isAllowed = true;
  return 0;
}

std::uint32_t PortAccess::In(std::uint16_t port, unsigned width) {
  return width == 1 ? ::inb(port) : width == 2 ? ::inw(port) : ::inl(port);
}

void PortAccess::Out(std::uint16_t port, unsigned width, std::uint32_t value) {
  if (width == 1) {
    ::outb(static_cast<std::uint8_t>(value), port);
  } else if (width == 2) {
    ::outw(static_cast<std::uint16_t>(value), port);
  } else {
    ::outl(value, port);
  }
}

#else

// Other processors have no I/O ports.
int PortAccess::Allow() { return ENOSYS; }
std::uint32_t PortAccess::In(std::uint16_t /*port*/, unsigned /*width*/) { return 0xFFFFFFFF; }
void PortAccess::Out(std::uint16_t /*port*/, unsigned /*width*/, std::uint32_t /*value*/) {}

#endif

}  // namespace panelglow::platform::host_linux
