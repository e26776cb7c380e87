// The machine's environment variables.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/Environment.h"

namespace panelglow::platform::sim {

class SimEnvironment : public Environment {
 public:
  explicit SimEnvironment(const std::map<std::string, std::string>& variables) : variables_(variables) {}
  std::optional<std::string> Variable(std::string_view name) override {
    const auto found = variables_.find(std::string(name));
    return found == variables_.end() ? std::nullopt : std::optional<std::string>(found->second);
  }

 private:
  const std::map<std::string, std::string>& variables_;
};

}  // namespace panelglow::platform::sim
