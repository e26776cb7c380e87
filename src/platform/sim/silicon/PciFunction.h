// One function in PCI configuration space.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace panelglow::platform::sim {

struct PciFunction {
  std::uint16_t location = 0;
  std::map<std::uint16_t, std::uint32_t> registers;  // dword offset to value
  std::vector<int> temperatures = {};                // of a graphics card's sensors, which its maker's library reads
  std::string controller = {};                       // instance id of the storage controller that it is, if one
  std::string description = "PCI device";            // in the device tree, of one that is none
};

}  // namespace panelglow::platform::sim
