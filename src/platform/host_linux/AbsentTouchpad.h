// A machine without the touchpad vendor's interface: the kernel has no door to a touchpad's LED.
#pragma once

#include "platform/Touchpad.h"

namespace panelglow::platform::host_linux {

class AbsentTouchpad : public Touchpad {
 public:
  std::unique_ptr<TouchpadApi> Create() override { return nullptr; }
};

}  // namespace panelglow::platform::host_linux
