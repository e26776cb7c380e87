// The connection manager of a simulated machine. It is always there; what it lists are the machine's adapters.
#pragma once

#include <memory>
#include <vector>

#include "platform/Connections.h"
#include "platform/sim/silicon/AdapterDevice.h"
#include "platform/sim/silicon/DoorContext.h"

namespace panelglow::platform::sim {

class SimConnections : public Connections {
 public:
  /// The adapters stay with the caller.
  SimConnections(std::vector<AdapterDevice*> adapters, DoorContext context)
      : adapters_(std::move(adapters)), context_(std::move(context)) {}

  std::unique_ptr<ConnectionList> Enumerate() override;

 private:
  class Held;
  class List;

  std::vector<AdapterDevice*> adapters_;
  DoorContext context_;
};

}  // namespace panelglow::platform::sim
