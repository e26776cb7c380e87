// The variables that the process was started with.
#pragma once

#include "platform/Environment.h"

namespace panelglow::platform::host_linux {

class LinuxEnvironment : public Environment {
 public:
  std::optional<std::string> Variable(std::string_view name) override;
};

}  // namespace panelglow::platform::host_linux
