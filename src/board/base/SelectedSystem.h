// What the selection of the board found out about the machine, for readers that come later.
#pragma once

#include <cstdint>
#include <string>

namespace panelglow {

struct SelectedSystem {
  std::string processorManufacturer;  // of the first processor, without blanks around it
  std::uint32_t processorFamily = 0;  // its published number
  std::string detectIniPath;          // where the flat keys stand
  std::string section;                // ... and in which section
};

/// Of the selection that was made last; from any thread.
SelectedSystem GetSelectedSystem();
void SetSelectedSystem(SelectedSystem system);

}  // namespace panelglow
