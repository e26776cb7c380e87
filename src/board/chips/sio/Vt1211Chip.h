// A VIA Super-I/O that is found by asking for it: temperatures, and the LED, which its power management drives.
// Serves the chip name "vt1211".
#pragma once

#include <cstdint>

#include "board/chips/RegisterChip.h"
#include "board/parts/ConfigRegisters.h"
#include "board/parts/PortRegisters.h"

namespace panelglow {

class Vt1211Chip : public RegisterChip {
 public:
  /// Looks where the part answers, and asks it for its bases. Without them it has no temperatures or no LED.
  Vt1211Chip();

 protected:
  RegisterFile& Monitor() override { return monitor; }
  RegisterFile& LedRegisters() override { return ledRegisters; }

 private:
  /// Configuration registers, and as the place kPorts the ports of the power management, while the mode is held.
  class LedFile : public ConfigRegisters {
   public:
    static constexpr std::uint8_t kPorts = 0xFE;

    explicit LedFile(const ConfigRegisters& registers) : ConfigRegisters(registers) {}
    std::uint8_t Read(RegisterId id) override;
    void Write(RegisterId id, std::uint8_t value) override;

    PortRegisters* ports = nullptr;
  };

  LedFile ledRegisters;
  PortRegisters power;
  PortRegisters monitor;
};

}  // namespace panelglow
