// The libraries that are installed on a simulated machine, and what those of graphics makers say of its cards.
#pragma once

#include <memory>
#include <string_view>

#include "platform/Modules.h"
#include "platform/sim/MachineDescription.h"
#include "platform/sim/base/Scheduler.h"

namespace panelglow::platform::sim {

class SimModules : public Modules {
 public:
  SimModules(const MachineDescription& machine, Scheduler& scheduler) : machine_(machine), scheduler_(scheduler) {}

  bool CanLoad(std::string_view file) override;
  std::unique_ptr<GraphicsLibrary> LoadGraphics(std::string_view file, GraphicsInterface interface) override;

 private:
  const MachineDescription& machine_;
  Scheduler& scheduler_;
};

}  // namespace panelglow::platform::sim
