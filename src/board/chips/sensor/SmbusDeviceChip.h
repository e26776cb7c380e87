// A device behind the SMBus whose registers are the power LED. Serves the chip name "smbus_device".
#pragma once

#include <cstdint>
#include <map>
#include <optional>

#include "board/chips/Chip.h"
#include "board/parts/SmbusHost.h"

namespace panelglow {

class SmbusDeviceChip : public Chip {
 public:
  SmbusDeviceChip();

  // ---- power LED. What cannot be read makes the save false, and the first write that fails ends its operation.
  bool SavePowerLedState() override;
  bool BlinkPowerLedGreen() override { return Write(green); }
  bool BlinkPowerLedRed() override { return Write(red); }

  /// Needs a whole save, and is its end when all is written.
  bool RestorePowerLedState() override;

 private:
  using Commands = std::map<std::uint8_t, std::uint8_t>;  // command and its value

  static Commands ReadCommands(const char* key, const char* defaultText);
  [[nodiscard]] bool Save(const Commands& commands, std::optional<Commands>& saved) const;
  [[nodiscard]] bool Write(const Commands& commands) const;

  SmbusHost host;
  std::uint8_t address;
  Commands green;
  Commands red;
  std::optional<Commands> savedGreen;
  std::optional<Commands> savedRed;
};

}  // namespace panelglow
