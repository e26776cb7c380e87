// A simulated machine that cannot be as its description says.
#pragma once

#include <stdexcept>

namespace panelglow::platform::sim {

/// The text names file, line and what to do.
class MachineError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

}  // namespace panelglow::platform::sim
