#include "platform/host_linux/LinuxHost.h"

namespace panelglow::platform {

Host& TheHost() {
  // Never destroyed: threads may still run when the process ends.
  static host_linux::LinuxHost* const machine = new host_linux::LinuxHost;
  return machine->host;
}

}  // namespace panelglow::platform
