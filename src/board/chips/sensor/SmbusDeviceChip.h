// A device behind the SMBus whose registers are the power LED. Serves the chip name "smbus_device".
#pragma once

#include <cstdint>
#include <map>

#include "board/chips/Chip.h"
#include "board/parts/SmbusHost.h"

namespace panelglow {

class SmbusDeviceChip : public Chip {
 public:
  SmbusDeviceChip();

  // ---- power LED. What cannot be read makes the save false, and the first write that fails ends its operation.
  // Without a base in the files nothing is touched.
  bool SavePowerLedState() override;
  bool BlinkPowerLedGreen() override { return Write(green); }
  bool BlinkPowerLedRed() override { return Write(red); }

  /// Writes what the save has read, and forgets it when all is written; true only for a whole save.
  bool RestorePowerLedState() override;

 private:
  using Commands = std::map<std::uint8_t, std::uint8_t>;  // command and its value

  static Commands ReadCommands(const char* key, const char* defaultText);
  bool Save(const Commands& commands, Commands& saved) const;
  [[nodiscard]] bool Write(const Commands& commands) const;

  bool hasBase;
  SmbusHost host;
  std::uint8_t address;
  Commands green;
  Commands red;
  Commands savedGreen;  // as far as they could be read
  Commands savedRed;
};

}  // namespace panelglow
