#include "platform/host_linux/AbsentInputs.h"

#include "platform/host_linux/CurrentThread.h"

namespace panelglow::platform::host_linux {

void AbsentInputs::Event(std::uint8_t /*virtualKey*/, std::uint8_t /*scanCode*/, std::uint32_t /*flags*/) {
  CurrentThread::CheckEndRequest();
}

}  // namespace panelglow::platform::host_linux
