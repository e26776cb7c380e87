// Libraries that are installed on the real machine, and the temperatures of its graphics cards.
#pragma once

#include <string>
#include <utility>

#include "platform/Modules.h"
#include "platform/host_linux/KernelFiles.h"
#include "platform/posix/TellPeople.h"

namespace panelglow::platform::host_linux {

/// A library "name.dll" is looked for as "libname.so" where the loader looks. What a graphics maker's library knows,
/// the kernel's own driver of the card tells here; only for cards under NVIDIA's driver, which does not, is there a
/// library to load.
class LinuxModules : public Modules {
 public:
  /// Touches nothing.
  explicit LinuxModules(KernelFolders folders = {}, std::string nvidiaLibrary = "libnvidia-ml.so.1")
      : folders_(std::move(folders)), nvidiaLibrary_(std::move(nvidiaLibrary)) {}

  bool CanLoad(std::string_view file) override;
  std::unique_ptr<GraphicsLibrary> LoadGraphics(std::string_view file, GraphicsInterface interface) override;

 private:
  const KernelFolders folders_;
  const std::string nvidiaLibrary_;
  posix::OnceTeller teller_;
};

}  // namespace panelglow::platform::host_linux
