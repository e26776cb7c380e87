// Libraries of the system that may or may not be installed.
#pragma once

#include <string_view>

namespace panelglow::platform {

class Modules {
 public:
  virtual ~Modules() = default;

  /// True when the library can be loaded; it is released at once.
  virtual bool CanLoad(std::string_view file) = 0;
};

}  // namespace panelglow::platform
