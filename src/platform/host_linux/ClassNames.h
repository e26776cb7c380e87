// What devices are, in words.
#pragma once

#include <string>

#include "platform/DeviceIds.h"

namespace panelglow::platform::host_linux {

inline constexpr const char* kCardName = "Memory Card";

/// By its class code; "PCI device" for a class without a name here. The names of products are not known to the
/// kernel.
std::string DescriptionOf(const PciFunctionIds& identity);

}  // namespace panelglow::platform::host_linux
