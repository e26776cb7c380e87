// The capture service of a simulated machine. It is always there; what it finds are the machine's cameras.
#pragma once

#include <memory>
#include <vector>

#include "platform/Cameras.h"
#include "platform/sim/silicon/CameraDevice.h"
#include "platform/sim/silicon/DoorContext.h"

namespace panelglow::platform::sim {

class SimCameras : public Cameras {
 public:
  /// The cameras stay with the caller. Any camera's fault of a step ahead of binding is one of the whole service.
  SimCameras(std::vector<CameraDevice*> cameras, DoorContext context)
      : cameras_(std::move(cameras)), context_(std::move(context)) {}

  std::unique_ptr<CaptureGraph> NewGraph() override;

 private:
  class Graph;
  class Inputs;

  [[nodiscard]] bool IsThere(const CameraDevice& camera) const {
    return !camera.IsGone() && !context_.buses.IsRemoved(camera.Setup().name);
  }

  std::vector<CameraDevice*> cameras_;
  DoorContext context_;
};

}  // namespace panelglow::platform::sim
