// The board class "Saddle": as "Lantern", with its Super-I/O at the other ports, and a green LED of its own.
#pragma once

#include <cstdint>

#include "board/Lantern.h"

namespace panelglow {

class Saddle : public Lantern {
 public:
  explicit Saddle(std::uint16_t boardId) : Lantern("Saddle", boardId, kIndexPort) {}

  bool SavePowerLedState() override;
  bool AssertPowerLedGreen() override;
  bool DeassertPowerLed() override;

 private:
  static constexpr std::uint16_t kIndexPort = 0x4E;
};

}  // namespace panelglow
