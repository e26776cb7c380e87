#include "platform/host_linux/LinuxHost.h"

#include "platform/HostInPlace.h"

namespace panelglow::platform {

Host& TheHost() {
  if (Host* const other = HostInPlace::Current()) {
    return *other;
  }
  // Never destroyed: threads may still run when the process ends.
  static host_linux::LinuxHost* const machine = new host_linux::LinuxHost;
  return machine->host;
}

}  // namespace panelglow::platform
