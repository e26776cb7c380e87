// Libraries that are installed on the real machine, and the temperatures of its graphics cards.
#pragma once

#include <utility>

#include "platform/Modules.h"
#include "platform/host_linux/KernelFiles.h"

namespace panelglow::platform::host_linux {

/// A library "name.dll" is looked for as "libname.so" where the loader looks. What a graphics maker's library knows,
/// the kernel's own driver of the card tells here: no library is loaded for it. Cards whose driver tells no
/// temperature, such as those of NVIDIA's own driver, are not served.
class LinuxModules : public Modules {
 public:
  /// Touches nothing.
  explicit LinuxModules(KernelFolders folders = {}) : folders_(std::move(folders)) {}

  bool CanLoad(std::string_view file) override;
  std::unique_ptr<GraphicsLibrary> LoadGraphics(std::string_view file, GraphicsInterface interface) override;

 private:
  const KernelFolders folders_;
};

}  // namespace panelglow::platform::host_linux
