#include "platform/host_linux/ThreadControl.h"

#include <sys/eventfd.h>

namespace panelglow::platform::host_linux {

posix::Descriptor ThreadControl::MakeEvent() { return posix::Descriptor(::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)); }

// The flag comes first: whoever is woken by the descriptor finds it set.
void ThreadControl::RequestEnd() {
  endRequested_ = true;
  ::eventfd_write(endRequest_.Get(), 1);
}

void ThreadControl::MarkEnded() {
  ended_ = true;
  ::eventfd_write(end_.Get(), 1);
}

}  // namespace panelglow::platform::host_linux
