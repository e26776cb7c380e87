// LEDs on a general-purpose I/O block in port space: an output latch at a port, and the pin levels at the port behind
// it. Serves the chip name "g_iospace".
#pragma once

#include "board/chips/generic/MaskedLedChip.h"

namespace panelglow {

class GIoSpaceChip : public MaskedLedChip {
 public:
  GIoSpaceChip() : MaskedLedChip("g_iospace", 16) {}

 protected:
  void SetEntry(std::uint32_t address, std::uint8_t mask) override;
  void KeepEntry(std::uint32_t address, std::uint8_t mask) override;
  void FlipEntry(std::uint32_t address, std::uint8_t mask) override;
  std::uint8_t ReadRegisterByte(std::uint32_t address) override;
  void WriteRegisterByte(std::uint32_t address, std::uint8_t value) override;

 private:
  std::uint8_t ReadPins(std::uint16_t port);
};

}  // namespace panelglow
