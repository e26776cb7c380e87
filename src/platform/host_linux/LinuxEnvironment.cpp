#include "platform/host_linux/LinuxEnvironment.h"

#include <cstdlib>

namespace panelglow::platform::host_linux {

std::optional<std::string> LinuxEnvironment::Variable(std::string_view name) {
  const char* value = std::getenv(std::string(name).c_str());
  return value == nullptr ? std::nullopt : std::optional<std::string>(value);
}

}  // namespace panelglow::platform::host_linux
