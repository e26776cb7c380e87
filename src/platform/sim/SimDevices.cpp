#include "platform/sim/SimDevices.h"

#include <algorithm>
#include <memory>

namespace panelglow::platform::sim {

template <class Part, class Setup>
std::vector<Part*> SimDevices::Attach(const std::vector<Setup>& setups, const DoorContext& context) {
  std::vector<Part*> made;
  for (const Setup& setup : setups) {
    auto part = std::make_unique<Part>(setup, context.scheduler);
    made.push_back(part.get());
    parts_.push_back(part.get());
    context.buses.Attach(setup.name, std::move(part));
  }
  return made;
}

SimDevices::SimDevices(const MachineDescription& machine, const DoorContext& context)
    : diskParts_(Attach<DiskDevice>(machine.disks, context)),
      isThere_([this, &buses = context.buses](const std::string& name) {
        const auto disk = std::find_if(diskParts_.begin(), diskParts_.end(),
                                       [&](const DiskDevice* part) { return part->Setup().name == name; });
        return !buses.IsRemoved(name) && (disk == diskParts_.end() || !(*disk)->IsGone());
      }),
      inventory_(machine, isThere_),
      tree(inventory_, context.scheduler),
      tables(machine, isThere_),
      registry(machine, context.scheduler),
      modules(machine, context.scheduler),
      disks(diskParts_, context),
      cameras(Attach<CameraDevice>(machine.cameras, context), context),
      connections(Attach<AdapterDevice>(machine.adapters, context), context) {}

}  // namespace panelglow::platform::sim
