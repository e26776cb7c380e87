// A Super-I/O of the SMSC line that is found by asking for it: temperatures, and the LED in two runtime registers.
// Serves the chip name "smsc5407".
#pragma once

#include "board/chips/RegisterChip.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/IndexedRegisters.h"
#include "board/parts/PortRegisters.h"

namespace panelglow {

class Smsc5407Chip : public RegisterChip {
 public:
  /// Looks where the part answers, and asks it for the base of its runtime registers; without one it has neither
  /// temperatures nor an LED.
  Smsc5407Chip();

  /// Puts the saved values back and keeps them; does nothing without a save.
  bool DeassertPowerLed() override;

 protected:
  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return runtime; }

 private:
  explicit Smsc5407Chip(std::uint16_t base);

  PortRegisters runtime;
  IndexedRegisters monitor;
};

}  // namespace panelglow
