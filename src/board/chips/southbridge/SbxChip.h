// An AMD southbridge of the older kind: GPIO levels in the configuration space of its SMBus function, reached through
// the configuration ports, and the hood switch as a latch of the power management registers. Serves the chip name
// "sbx"; the base of "sb710".
#pragma once

#include <cstdint>
#include <span>
#include <string>

#include "board/chips/Chip.h"
#include "board/parts/Lines.h"

namespace panelglow {

class SbxChip : public Chip {
 public:
  SbxChip();

  /// 238 is the hood switch as the chipset latches it.
  int ReadLine(int line) override;

 protected:
  /// For a derived class, with its line map: a line's place is a configuration register. The map must live as long as
  /// the chip.
  SbxChip(std::string chipName, const std::string& prefix, std::span<const LineRange> map);

 private:
  std::uint32_t ReadConfig(std::uint16_t reg);
  int ReadLatch();

  std::span<const LineRange> lines;
  std::uint32_t smbusbar;  // address of the function, for the configuration index port
  std::uint16_t pciIndex;
  std::uint16_t pciData;
};

}  // namespace panelglow
