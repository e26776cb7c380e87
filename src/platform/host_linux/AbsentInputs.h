// A machine without a keyboard to press keys on, and without the touchpad vendor's interface.
#pragma once

#include "platform/Keyboard.h"
#include "platform/Touchpad.h"

namespace panelglow::platform::host_linux {

class AbsentInputs : public Keyboard, public Touchpad {
 public:
  void Event(std::uint8_t virtualKey, std::uint8_t scanCode, std::uint32_t flags) override;
  std::unique_ptr<TouchpadApi> Create() override { return nullptr; }
};

}  // namespace panelglow::platform::host_linux
