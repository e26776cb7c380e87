// A Super-I/O of the SMSC line with its registers in code: its hardware monitor behind an index and a data port, and
// GPIO, the lock of the hood and the LED in the runtime registers. Serves the chip name "sio"; the base of its
// family.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "board/chips/RegisterChip.h"
#include "board/parts/IndexedRegisters.h"
#include "board/parts/PortRegisters.h"

namespace panelglow {

class SioChip : public RegisterChip {
 public:
  SioChip();

  /// Signed degrees; 255 where there is no sensor.
  bool ReadTemperature(int zone, int& value) override { return ReadZone(zones.zones, zone, value); }
  bool ReadLowLimitTemperature(int zone, int& value) override { return ReadZone(lowLimits, zone, value); }

  /// The line 238, the part's own switch, always reads closed.
  bool ReadIntrusionLatch(int line, bool clearFirst, bool& value) override;

  /// Waits until the lock stands still, for three seconds at most. With `check`, `line` must then show what it does.
  bool LockHood(int line, bool check) override;
  bool UnlockHood(int line, bool check) override;

  int ReadLine(int line) override;
  bool ReadLineActivity(int line, int& value) override;

  /// Takes the LED's two lines from their other function, and gives them back to it; without a save nothing is given
  /// back. The colour register is not kept: with its lines given back the part drives the LED, and the colour counts
  /// for nothing.
  bool SavePowerLedState() override;
  bool RestorePowerLedState() override;

 protected:
  /// For a derived class, which then reads its own keys and sets its tables. The keys of this class are read first.
  explicit SioChip(std::string chipName);

  /// The bases of one class of the family, with their defaults.
  void ReadKeys(const std::string& prefix, std::uint16_t pmbarDefault, std::uint16_t hwmbarDefault);

  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return runtime; }

 private:
  bool ReadZone(const std::vector<RegisterId>& registers, int zone, int& value);
  bool MoveHood(std::uint8_t command, int line, bool check, int wanted);

  bool isSaved = false;     // the LED's lines are taken
  std::uint16_t pmbar = 0;  // base of the runtime registers
  std::uint16_t hoodLockOffset = 0;
  IndexedRegisters monitor;
  PortRegisters runtime;
  std::vector<RegisterId> lowLimits;
};

}  // namespace panelglow
