// NVIDIA's management library, which comes with the maker's own driver and knows the temperatures of its cards: that
// driver tells the kernel none.
#pragma once

#include <memory>
#include <string>

#include "platform/Modules.h"

namespace panelglow::platform::host_linux {

/// Null when the library is not installed, is not one of these, or finds no driver.
std::unique_ptr<GraphicsLibrary> LoadNvidiaLibrary(const std::string& file);

}  // namespace panelglow::platform::host_linux
