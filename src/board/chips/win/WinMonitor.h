// The hardware monitor of a Winbond Super-I/O: banks of registers behind an index and a data port, whose base is told
// by a logical device.
#pragma once

#include <cstdint>

#include "board/parts/ConfigRegisters.h"
#include "board/parts/IndexedPorts.h"
#include "board/parts/RegisterFile.h"
#include "hw/CDevio.h"

namespace panelglow {

/// Places are banks. Every access enters configuration mode, wakes the device, asks it for its base, selects the bank
/// and leaves.
class WinMonitor : public RegisterFile {
 public:
  /// `indexPort` is used where the device has no base.
  WinMonitor(CDevio& client, const ConfigRegisters& registers, std::uint16_t indexPort)
      : devio(&client), config(registers), fallback(indexPort) {}

  std::uint8_t Read(RegisterId id) override;
  void Write(RegisterId id, std::uint8_t value) override;

 private:
  IndexedPorts SelectBank(std::uint8_t bank);

  CDevio* devio;
  ConfigRegisters config;
  std::uint16_t fallback;
};

}  // namespace panelglow
