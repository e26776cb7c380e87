// What every door of the simulated machine needs of it.
#pragma once

#include <functional>
#include <string>

#include "platform/sim/base/Scheduler.h"
#include "platform/sim/silicon/Buses.h"

namespace panelglow::platform::sim {

struct DoorContext {
  Scheduler& scheduler;
  Buses& buses;
  std::function<void()> moved;  // to be called after everything that may have moved a pin

  /// Orders to this part are taken and do nothing; see kOrders.
  [[nodiscard]] bool Ignores(const std::string& device) const { return buses.IsIgnored(device, kOrders); }

  /// Stands for the one register of a part that takes its orders from a service and not from the bus.
  static constexpr std::uint64_t kOrders = 0;
};

}  // namespace panelglow::platform::sim
