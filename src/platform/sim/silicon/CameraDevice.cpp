#include "platform/sim/silicon/CameraDevice.h"

#include "platform/sim/silicon/DoorContext.h"

namespace panelglow::platform::sim {

bool CameraDevice::Start(const void* user) {
  if (user_ != nullptr && user_ != user) {
    return false;
  }
  user_ = user;
  return true;
}

void CameraDevice::Stop(const void* user) {
  if (user_ == user) {
    user_ = nullptr;
  }
}

std::optional<bool> CameraDevice::Signal(std::string_view pin) const {
  return pin == "capture" ? std::optional<bool>(IsCapturing()) : std::nullopt;
}

std::optional<Microseconds> CameraDevice::NextEvent() const {
  return setup_.goneAt && *setup_.goneAt > time_.Now() ? setup_.goneAt : std::nullopt;
}

std::optional<std::uint64_t> CameraDevice::RegisterOf(std::string_view pin) const {
  return pin == "capture" ? std::optional<std::uint64_t>(DoorContext::kOrders) : std::nullopt;
}

std::string CameraDevice::State() const {
  return "camera " + setup_.name + (IsCapturing() ? " = captures\n" : " = idle\n");
}

}  // namespace panelglow::platform::sim
