#include "platform/sim/ControllerDescription.h"

#include <cstdio>

namespace panelglow::platform::sim {

std::optional<PciIdentity> ParsePciInstanceId(const std::string& instanceId) {
  unsigned vendor = 0;
  unsigned device = 0;
  unsigned subsystem = 0;
  unsigned revision = 0;
  int end = 0;
  // NOLINTNEXTLINE(cert-err34-c): the widths keep every number in range
  if (std::sscanf(instanceId.c_str(), "PCI\\VEN_%4X&DEV_%4X&SUBSYS_%8X&REV_%2X\\%n", &vendor, &device, &subsystem,
                  &revision, &end) != 4 ||
      end == 0) {
    return std::nullopt;
  }
  const std::size_t last = instanceId.rfind('&');
  unsigned place = 0;
  // NOLINTNEXTLINE(cert-err34-c)
  if (last < static_cast<std::size_t>(end) || std::sscanf(instanceId.c_str() + last, "&%2X", &place) != 1) {
    return std::nullopt;
  }
  return PciIdentity{static_cast<std::uint16_t>(vendor), static_cast<std::uint16_t>(device), subsystem,
                     static_cast<std::uint8_t>(revision), static_cast<std::uint8_t>(place)};
}

}  // namespace panelglow::platform::sim
