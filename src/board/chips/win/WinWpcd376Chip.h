// A Super-I/O of the Winbond line that came from another maker: its registers are always open, its hardware monitor
// is paged, and it moves the lock of the hood. Serves the chip name "win_wpcd376".
#pragma once

#include <cstdint>

#include "board/chips/RegisterChip.h"
#include "board/chips/win/PagedPorts.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/PortRegisters.h"
#include "board/parts/RegistersOf.h"

namespace panelglow {

class WinWpcd376Chip : public RegisterChip {
 public:
  WinWpcd376Chip();

  bool LockHood(int line, bool check) override;
  bool UnlockHood(int line, bool check) override;

  /// Gives the LED its pins. What they were before is not kept: a restore leaves the LED green, as firmware does.
  /// Without a save it does nothing.
  bool SavePowerLedState() override;
  bool RestorePowerLedState() override;

 protected:
  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return gpio; }

  /// Also takes the fan from the part, and waits until it has the new duty.
  bool WriteDuty(int fan, int value) override;

 private:
  std::uint8_t ReadMonitor(std::uint8_t reg);
  void WriteMonitor(std::uint8_t reg, std::uint8_t value);

  bool isSaved = false;  // the LED's pins are taken
  ConfigRegisters config;
  PortRegisters gpio;
  PagedPorts pages;
  RegistersOf<WinWpcd376Chip> monitor;
};

}  // namespace panelglow
