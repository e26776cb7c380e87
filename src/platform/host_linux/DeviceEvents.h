// Arrivals and removals of devices, as the kernel announces them.
#pragma once

#include <cstdint>
#include <vector>

namespace panelglow::platform::host_linux {

class DeviceEvents {
 public:
  /// Listens to the kernel; where that is not allowed there is never an event.
  DeviceEvents();
  ~DeviceEvents();
  DeviceEvents(const DeviceEvents&) = delete;
  DeviceEvents& operator=(const DeviceEvents&) = delete;

  /// Readable when Take() may have something; -1 for never.
  [[nodiscard]] int Descriptor() const { return socket_; }

  /// What the windows are to be told since the last call (numbers of namespace device_event); never blocks.
  std::vector<std::uint32_t> Take();

 private:
  int socket_;
};

}  // namespace panelglow::platform::host_linux
