// The hardware monitor of the oldest boards, as a chip: the files name its fans and zones by registers.
#pragma once

#include <cstdint>

#include "board/chips/RegisterChip.h"
#include "board/parts/IndexedPorts.h"
#include "board/parts/IndexedRegisters.h"

namespace panelglow {

/// A fan's tachometer is two neighbouring registers; its duty is the row of its number. Nothing is touched while the
/// ports are not known.
class LegacyMonitor : public RegisterChip {
 public:
  struct Traits {
    std::int64_t tachClock = 0;  // counts per minute
    bool isLatched = false;  // reading the low byte, in the first register, holds the high one; else the high byte
                             // is in the first and may have moved on
    FanTable fans = {};
  };

  /// `indexPort` 0: not known.
  LegacyMonitor(CDevio& client, std::uint16_t indexPort, std::uint16_t dataPort, Traits fixed);

  /// Whether the files say where it is.
  [[nodiscard]] bool IsKnown() const { return isKnown; }

  /// `fan`: its first register.
  std::uint32_t ReadFanTach(int fan, int arg) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
  bool SaveFanState() override { return isKnown && RegisterChip::SaveFanState(); }
  bool RestoreFanState() override { return isKnown && RegisterChip::RestoreFanState(); }
  bool SetManualFanMode(bool on) override { return isKnown && RegisterChip::SetManualFanMode(on); }
  bool SetFanFullSpeed(int fan) override { return isKnown && RegisterChip::SetFanFullSpeed(fan); }
  bool SetFanPwm(int fan, int value) override { return isKnown && RegisterChip::SetFanPwm(fan, value); }

  /// `zone`: its register.
  bool ReadTemperature(int zone, int& value) override;

 protected:
  RegisterFile& Monitor() override { return registers; }
  RegisterFile& LedRegisters() override { return registers; }

 private:
  [[nodiscard]] std::uint8_t Read(int reg);

  IndexedRegisters registers;
  bool isKnown;
  Traits traits;
};

}  // namespace panelglow
