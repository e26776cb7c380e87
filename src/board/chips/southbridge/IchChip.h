// An Intel southbridge: GPIO lines as bits of three dwords in ports, two of which are the power LED's colours, the
// hood switch as a latch of the power management block, and its power button. Serves the chip name "ich"; the base of
// "hudson".
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "board/chips/Chip.h"
#include "board/parts/Lines.h"
#include "board/parts/PowerButton.h"

namespace panelglow {

class IchChip : public Chip {
 public:
  IchChip();

  /// 238 is the hood switch as the chipset latches it: the latch is cleared and read again.
  int ReadLine(int line) override;

  /// With `clearFirst` the switch's input is pulled first, and false is given when the latch does not see it. Line -1
  /// is the latch as it stands; a line that the part does not have is false.
  bool ReadIntrusionLatch(int line, bool clearFirst, bool& value) override;
  bool ReadLineActivity(int line, int& value) override;

  bool SavePowerButtonState() override;
  bool ArmPowerButton() override;
  bool IsPowerButtonPressed(bool& pressed) override;
  bool RestorePowerButtonState() override;

  // ---- power LED: two lines. False, and nothing touched, for a colour whose line the part does not have.
  bool IsPowerLedRedSupported(bool& supported) override;
  /// Keeps what can be lit, also where it is false because one of the lines is missing.
  bool SavePowerLedState() override;
  bool AssertPowerLedGreen() override { return SetLine(primary); }
  bool AssertPowerLedRed() override { return SetLine(secondary); }
  bool DeassertPowerLed() override;
  bool RestorePowerLedState() override;

  /// Drives an output pin of a network controller low and high, and looks whether the line follows. `idList`: its
  /// vendor, device, subsystem vendor and subsystem device as numbers, separated by blanks. The pin ends high.
  int ReadDashCable(int line, const std::string& idList) override;

 protected:
  /// `base`: first port of the power management block.
  IchChip(std::string chipName, std::uint16_t base);

  /// Whether ReadLine knows the line.
  [[nodiscard]] virtual bool HasLine(int line) const;

 private:
  /// The port and the bit of a line.
  [[nodiscard]] std::optional<LinePlace> MapGpio(int line) const;
  bool SetLine(int line);
  void KeepPort(std::uint16_t port);
  void ClearBits(std::uint16_t port, std::uint32_t mask);
  void ClearLatch();

  /// Makes the latch set itself, and clears it. False when it stays clear.
  bool PullIntruderInput();
  bool IsLatched();

  std::uint16_t pmbar;
  std::uint16_t gpiobar;
  std::uint16_t enableOffset;  // in the power management block
  std::uint16_t statusOffset;
  int primary;  // lines of the LED's colours
  int secondary;
  PowerButton button;
  std::vector<std::pair<std::uint16_t, std::uint32_t>> savedLed;  // ports and their dwords
};

}  // namespace panelglow
