// The touchpad vendor's programming interface, as far as its LED needs it.
#pragma once

#include <cstdint>
#include <memory>

namespace panelglow::platform {

class TouchpadDevice {
 public:
  virtual ~TouchpadDevice() = default;

  /// Writes one numeric property of the device. False when the device refuses.
  virtual bool SetProperty(std::uint32_t property, std::int32_t value) = 0;
};

class TouchpadApi {
 public:
  virtual ~TouchpadApi() = default;

  /// Looks for the next device behind `handle` (-1 starts) of the given connection (0: any) and type (2: touchpad).
  /// False when there is none.
  virtual bool FindDevice(std::int32_t connection, std::int32_t type, std::int32_t& handle) = 0;

  /// Opens a found device; null on failure.
  virtual std::unique_ptr<TouchpadDevice> OpenDevice(std::int32_t handle) = 0;
};

class Touchpad {
 public:
  virtual ~Touchpad() = default;

  /// Creates and initialises the vendor's interface object; null when it is not installed.
  virtual std::unique_ptr<TouchpadApi> Create() = 0;
};

}  // namespace panelglow::platform
