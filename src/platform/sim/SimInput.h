// What the program sends to the keyboard's and the touchpad's LEDs.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <utility>

#include "platform/Keyboard.h"
#include "platform/Touchpad.h"
#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Buses.h"
#include "platform/sim/silicon/KeyboardDevice.h"

namespace panelglow::platform::sim {

/// The name of the keyboard among the machine's devices.
constexpr const char* kKeyboard = "keyboard";

class SimKeyboard : public Keyboard {
 public:
  SimKeyboard(Scheduler& scheduler, Buses& buses, KeyboardDevice& device, std::function<void()> moved)
      : scheduler_(scheduler), buses_(buses), device_(device), moved_(std::move(moved)) {}
  void Event(std::uint8_t virtualKey, std::uint8_t scanCode, std::uint32_t flags) override {
    scheduler_.Spend(20);
    if (!buses_.IsRemoved(kKeyboard) && !buses_.IsIgnored(kKeyboard, virtualKey)) {
      device_.Event(virtualKey, scanCode, flags);
    }
    moved_();
  }

 private:
  Scheduler& scheduler_;
  Buses& buses_;
  KeyboardDevice& device_;
  std::function<void()> moved_;
};

// The vendor's touchpad interface: one touchpad with one LED property.
class SimTouchpad : public Touchpad {
 public:
  SimTouchpad(bool present, Scheduler& scheduler, Buses& buses, KeyboardDevice& device, std::function<void()> moved)
      : present_(present), scheduler_(scheduler), buses_(buses), device_(device), moved_(std::move(moved)) {}

  std::unique_ptr<TouchpadApi> Create() override { return present_ ? std::make_unique<Api>(*this) : nullptr; }

 private:
  static constexpr std::int32_t kDevice = 3;
  static constexpr std::int32_t kTypeTouchpad = 2;
  static constexpr std::uint32_t kLedProperty = 0x10000171;

  class Pad : public TouchpadDevice {
   public:
    explicit Pad(SimTouchpad& owner) : owner_(owner) {}
    bool SetProperty(std::uint32_t property, std::int32_t value) override {
      owner_.scheduler_.Spend(50);
      if (property != kLedProperty) {
        return false;
      }
      if (!owner_.buses_.IsIgnored(kKeyboard, KeyboardDevice::kTouchpadLed)) {
        owner_.device_.SetTouchpadLed(value != 0);
      }
      owner_.moved_();
      return true;
    }

   private:
    SimTouchpad& owner_;
  };

  class Api : public TouchpadApi {
   public:
    explicit Api(SimTouchpad& owner) : owner_(owner) {}
    bool FindDevice(std::int32_t connection, std::int32_t type, std::int32_t& handle) override {
      if (connection != 0 || type != kTypeTouchpad || handle != -1) {
        return false;
      }
      handle = kDevice;
      return true;
    }
    std::unique_ptr<TouchpadDevice> OpenDevice(std::int32_t handle) override {
      return handle == kDevice ? std::make_unique<Pad>(owner_) : nullptr;
    }

   private:
    SimTouchpad& owner_;
  };

  bool present_;
  Scheduler& scheduler_;
  Buses& buses_;
  KeyboardDevice& device_;
  std::function<void()> moved_;
};

}  // namespace panelglow::platform::sim
