// Raw access to the disks of a simulated machine.
#pragma once

#include <memory>
#include <vector>

#include "platform/RawDisks.h"
#include "platform/sim/silicon/DiskDevice.h"
#include "platform/sim/silicon/DoorContext.h"

namespace panelglow::platform::sim {

class SimRawDisks : public RawDisks {
 public:
  /// The disks stay with the caller.
  SimRawDisks(std::vector<DiskDevice*> disks, DoorContext context)
      : disks_(std::move(disks)), context_(std::move(context)) {}

  /// By the drive's path or its interface path, without regard to case.
  std::unique_ptr<RawDisk> Open(std::string_view path) override;
  std::unique_ptr<DiskBlock> Allocate(std::size_t size_bytes) override;

 private:
  class Handle;

  std::vector<DiskDevice*> disks_;
  DoorContext context_;
};

}  // namespace panelglow::platform::sim
