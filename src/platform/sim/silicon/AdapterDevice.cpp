#include "platform/sim/silicon/AdapterDevice.h"

#include <algorithm>

#include "platform/sim/silicon/DoorContext.h"

namespace panelglow::platform::sim {

Microseconds AdapterDevice::Order(bool up) {
  const Microseconds now = time_.Now();
  wasUp_ = IsUp();
  std::erase_if(changes_, [now](const Change& change) { return change.at <= now; });
  const Microseconds begin = changes_.empty() ? now : changes_.back().at;
  changes_.push_back({begin + (up ? setup_.connect_us : setup_.disconnect_us), up});
  return changes_.back().at;
}

bool AdapterDevice::IsUp() const {
  bool up = wasUp_;
  for (const Change& change : changes_) {
    if (change.at <= time_.Now()) {
      up = change.up;
    }
  }
  return up;
}

std::optional<bool> AdapterDevice::Signal(std::string_view pin) const {
  return pin == "link" ? std::optional<bool>(IsUp()) : std::nullopt;
}

std::optional<Microseconds> AdapterDevice::NextEvent() const {
  const auto next = std::find_if(changes_.begin(), changes_.end(),
                                 [this](const Change& change) { return change.at > time_.Now(); });
  return next == changes_.end() ? std::nullopt : std::optional<Microseconds>(next->at);
}

std::optional<Microseconds> AdapterDevice::UnderWayUntil() const {
  return changes_.empty() || changes_.back().at <= time_.Now() ? std::nullopt
                                                               : std::optional<Microseconds>(changes_.back().at);
}

std::optional<std::uint64_t> AdapterDevice::RegisterOf(std::string_view pin) const {
  return pin == "link" ? std::optional<std::uint64_t>(DoorContext::kOrders) : std::nullopt;
}

std::string AdapterDevice::State() const { return "adapter " + setup_.name + (IsUp() ? " = up\n" : " = down\n"); }

}  // namespace panelglow::platform::sim
