#include "platform/sim/SimRegistry.h"

#include <algorithm>
#include <cstring>

#include "platform/AsciiCase.h"

namespace panelglow::platform::sim {

namespace {

constexpr Microseconds kCallCost_us = 20;
constexpr std::uint32_t kErrorFileNotFound = 2;

}  // namespace

class SimRegistry::Key : public RegistryKey {
 public:
  Key(const Values& values, Scheduler& scheduler) : values_(values), scheduler_(scheduler) {}

  std::uint32_t Read(std::string_view value, std::span<char> room, std::size_t& size) override {
    scheduler_.Spend(kCallCost_us);
    const auto found = values_.find(Lowered(value));
    if (found == values_.end()) {
      return kErrorFileNotFound;
    }
    size = found->second.size() + 1;
    if (room.size() < size) {
      return kMoreData;
    }
    std::memcpy(room.data(), found->second.c_str(), size);
    return 0;
  }

 private:
  const Values& values_;
  Scheduler& scheduler_;
};

SimRegistry::SimRegistry(const MachineDescription& machine, Scheduler& scheduler) : scheduler_(scheduler) {
  for (const ControllerDescription& controller : machine.controllers) {
    for (const std::uint8_t port : controller.scsiPorts) {
      const std::string path = Lowered("HARDWARE\\DEVICEMAP\\Scsi\\Scsi Port " + std::to_string(port));
      if (!keys_.emplace(path, Values{{"driver", controller.driver}}).second) {
        throw MachineError("two controllers have the SCSI port " + std::to_string(port));
      }
    }
  }
}

std::unique_ptr<RegistryKey> SimRegistry::OpenMachineKey(std::string_view path) {
  scheduler_.Spend(kCallCost_us);
  const auto found = keys_.find(Lowered(path));
  return found == keys_.end() ? nullptr : std::make_unique<Key>(found->second, scheduler_);
}

}  // namespace panelglow::platform::sim
