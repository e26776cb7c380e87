// LEDs on byte registers in the physical address space, as a chipset's memory-mapped GPIO. Serves the chip name
// "g_memoryspace".
#pragma once

#include "board/chips/generic/MaskedLedChip.h"
#include "board/parts/PhysicalRegisters.h"

namespace panelglow {

class GMemorySpaceChip : public MaskedLedChip {
 public:
  GMemorySpaceChip();

  /// Level of the GPIO line whose 16-bit register stands at `offset` of the GPIO block; `bitName` is the bit's number
  /// as text. kNoSuchLine when the register cannot be read.
  int ReadLineByNames(std::uint32_t offset, const std::string& bitName, const std::string& clearBitName) override;

 protected:
  void SetEntry(std::uint32_t address, std::uint8_t mask) override;
  void KeepEntry(std::uint32_t address, std::uint8_t mask) override;
  void FlipEntry(std::uint32_t address, std::uint8_t mask) override;
  std::uint8_t ReadRegisterByte(std::uint32_t address) override;
  void WriteRegisterByte(std::uint32_t address, std::uint8_t value) override;

 private:
  PhysicalRegisters memory;  // of the whole address space
  std::uint32_t gpioBar;     // physical address of the GPIO block
};

}  // namespace panelglow
