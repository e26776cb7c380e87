// An AMD southbridge of the newer kind: GPIO lines and fan tachometers as bytes in physical memory. Its power LED is
// the elder's, on the elder's ports. Serves the chip name "hudson".
#pragma once

#include <cstdint>
#include <string>

#include "board/chips/southbridge/IchChip.h"
#include "board/parts/PhysicalRegisters.h"

namespace panelglow {

class HudsonChip : public IchChip {
 public:
  HudsonChip();

  /// Fans 0 to 4.
  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;

  /// Lines 0 to 255, a byte each. 238 is the hood switch as the chipset latches it.
  int ReadLine(int line) override;

  /// A bit of a register of the power management block; with `clearBitName` that bit is pulsed first. Bits are named
  /// by their number.
  int ReadLineByNames(std::uint32_t reg, const std::string& bitName, const std::string& clearBitName) override;

 protected:
  [[nodiscard]] bool HasLine(int line) const override;

 private:
  int ReadLatch();
  [[nodiscard]] int ReadLevel(std::uint32_t line) const;

  std::uint32_t gpiobar;         // physical address
  std::uint16_t indirectioaddr;  // index port of the power management registers
  PhysicalRegisters memory;
};

}  // namespace panelglow
