// Environment variables of the process.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace panelglow::platform {

class Environment {
 public:
  virtual ~Environment() = default;

  /// The variable's value, or nothing when it is not set.
  virtual std::optional<std::string> Variable(std::string_view name) = 0;
};

}  // namespace panelglow::platform
