// The configuration registers of the ITE line: the last key tells at which port the part is meant, and a register
// closes them.
#pragma once

#include "board/parts/ConfigRegisters.h"

namespace panelglow {

class IteConfigRegisters : public ConfigRegisters {
 public:
  IteConfigRegisters(CDevio& client, std::uint16_t indexPort)
      : ConfigRegisters(IndexedPorts(client, indexPort), {0x87, 0x01, 0x55, LastKey(indexPort)}, {}) {}

  void ExitConfigMode() override { Ports().SetBits(kConfigureControl, kReturnToWaitForKey); }

 private:
  static constexpr std::uint8_t kConfigureControl = 0x02;
  static constexpr std::uint8_t kReturnToWaitForKey = 0x02;  // bit of it

  static constexpr std::uint8_t LastKey(std::uint16_t indexPort) { return indexPort == 0x2E ? 0x55 : 0xAA; }
};

}  // namespace panelglow
