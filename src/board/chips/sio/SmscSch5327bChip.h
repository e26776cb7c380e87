// A Super-I/O of the SMSC line whose LED is driven by two runtime registers, found by asking the part. Serves the
// chip name "smsc_sch5327b".
#pragma once

#include <cstdint>

#include "board/chips/sio/SioChip.h"
#include "board/parts/ConfigRegisters.h"

namespace panelglow {

class SmscSch5327bChip : public SioChip {
 public:
  /// Asks the part for the base of its runtime registers; without one it has no LED.
  SmscSch5327bChip();

  // By the table: the base's LED is in other registers. NOLINTBEGIN(bugprone-parent-virtual-call)
  bool SavePowerLedState() override { return RegisterChip::SavePowerLedState(); }
  bool RestorePowerLedState() override { return RegisterChip::RestorePowerLedState(); }
  // NOLINTEND(bugprone-parent-virtual-call)

 protected:
  RegisterFile& LedRegisters() override { return ledRegisters; }

 private:
  /// Runtime registers that are reached in configuration mode.
  class LedFile : public PortRegisters {
   public:
    LedFile(CDevio& client, std::uint16_t basePort, ConfigRegisters& within)
        : PortRegisters(client, basePort), config(&within) {}
    void EnterConfigMode() override { config->EnterConfigMode(); }
    void ExitConfigMode() override { config->ExitConfigMode(); }

   private:
    ConfigRegisters* config;
  };

  ConfigRegisters config;
  LedFile ledRegisters;
};

}  // namespace panelglow
