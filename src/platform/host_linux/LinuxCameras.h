// Video capture by the kernel's video interface (V4L2). A camera's LED follows its stream: buffers are queued and the
// stream is switched on, and no frame is ever looked at.
#pragma once

#include <string>

#include "platform/Cameras.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

class LinuxCameras : public Cameras {
 public:
  /// `deviceFolder`: where the video devices are.
  explicit LinuxCameras(std::string deviceFolder = "/dev") : folder_(std::move(deviceFolder)) {}
  std::unique_ptr<CaptureGraph> NewGraph() override;

 private:
  std::string folder_;
  posix::OnceTeller teller_;
};

}  // namespace panelglow::platform::host_linux
