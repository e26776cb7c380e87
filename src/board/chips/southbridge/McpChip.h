// An NVIDIA southbridge: GPIO lines as a port each, the hood switch and the power button in the power management
// block. Serves the chip name "mcp".
#pragma once

#include <cstdint>
#include <optional>

#include "board/chips/Chip.h"
#include "board/parts/PortRegisters.h"

namespace panelglow {

class McpChip : public Chip {
 public:
  McpChip();

  /// Lines 0 to 63 while their pins are inputs. 238 is the hood switch as the chipset latches it.
  int ReadLine(int line) override;

  bool SavePowerButtonState() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;
  bool RestorePowerButtonState() override;

 private:
  [[nodiscard]] std::uint16_t PortOf(unsigned offset) const { return static_cast<std::uint16_t>(pmbar + offset); }
  int ReadLatch();

  std::uint16_t pmbar;  // base port of the power management block
  PortRegisters inputs;
  std::optional<std::uint16_t> savedEnable;
};

}  // namespace panelglow
