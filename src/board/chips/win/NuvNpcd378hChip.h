// A Super-I/O of the Nuvoton line whose registers are always open: a paged hardware monitor that has to be told of
// what is written to it, the LED in a port, and the lock of the hood. Serves the chip name "nuv_npcd378h".
#pragma once

#include <cstdint>
#include <vector>

#include "board/chips/RegisterChip.h"
#include "board/chips/win/PagedPorts.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/PortRegisters.h"

namespace panelglow {

class NuvNpcd378hChip : public RegisterChip {
 public:
  /// Asks the part for its bases. Without one, what stands there answers as a fan or a lamp that the part does not
  /// have.
  NuvNpcd378hChip();

  std::uint32_t ReadFanTach(int fan, int arg) override;

  /// The part gives revolutions per minute.
  int TachToRpm(std::uint32_t raw, int multiplier) override;

  // One fan is taken from the part, and given back. Nothing is done for a fan that it does not have.
  void SaveFanControl(int fan) override;
  void TakeFanControl(int fan) override;
  void RestoreFanControl(int fan) override;

  /// False beyond the part's four pages, and without a monitor.
  bool ReadEnvironmentRegister(std::uint16_t reg, std::uint8_t& value) override;

  /// False for a bit that a register does not have.
  bool ReadConfigBit(std::uint8_t ldn, std::uint8_t reg, int bit, bool& value) override;

  bool LockHood(int line, bool check) override;
  bool UnlockHood(int line, bool check) override;

 protected:
  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return gpio; }

 private:
  /// Nothing for a fan that the part does not have.
  [[nodiscard]] std::vector<RegisterId> ControlOf(int fan) const;
  bool MoveHood(bool locks);

  ConfigRegisters config;
  PagedPorts monitor;
  bool hasMonitor = false;  // the monitor has a base
  PortRegisters gpio;
  std::vector<RegisterId> controls;
  SavedRegisters savedControls;
};

}  // namespace panelglow
