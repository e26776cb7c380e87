// What a PCI function is, in words, by its class code.
#pragma once

#include <string>

#include "platform/DeviceIds.h"

namespace panelglow::platform::host_linux {

/// "PCI device" for a class without a name here. The names of products are not known to the kernel.
std::string DescriptionOf(const PciFunctionIds& identity);

}  // namespace panelglow::platform::host_linux
