// The power button in a chipset's power management block: a control byte, a word that enables its events, and a
// status byte in which a press is latched.
#pragma once

#include <cstdint>
#include <optional>

#include "hw/CDevio.h"

namespace panelglow {

struct PowerButtonPorts {
  std::uint16_t control;
  std::uint16_t enable;
  std::uint16_t status;
};

/// While armed, a press is latched and switches nothing off.
class PowerButton {
 public:
  PowerButton(CDevio& client, PowerButtonPorts at) : devio(&client), ports(at) {}

  // Nothing is kept twice before it was put back.
  void Save();
  void Arm();
  [[nodiscard]] bool IsPressed() const;

  /// Puts back what was kept, and forgets it; what was not is left alone.
  void Restore();

 private:
  CDevio* devio;
  PowerButtonPorts ports;
  std::optional<std::uint8_t> savedControl;  // as Save found it
  std::optional<std::uint16_t> savedEnable;  // as Arm found it
};

}  // namespace panelglow
