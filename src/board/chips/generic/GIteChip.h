// A generic Super-I/O of the ITE line: leaves configuration mode by a register bit, blinks its power LED by itself,
// and watches the hood's intrusion switch. Serves the chip name "g_ite".
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/base/Setting.h"
#include "board/chips/generic/GSioChip.h"

namespace panelglow {

class GIteChip : public GSioChip {
 public:
  GIteChip() : GIteChip("g_ite") {}

  void Initialize() override;
  bool EnterManualFanMode() override;

  /// Only the intrusion input, line 237, exists.
  int ReadLine(int line) override;

  bool DeassertPowerLed() override { return true; }
  bool BlinkPowerLedGreen() override { return RunBlinkList(greenBlink); }
  bool BlinkPowerLedRed() override { return RunBlinkList(redBlink); }

  void ExitConfigMode() override;

  /// Chip id and revision, as 0x872005.
  virtual std::uint32_t ReadChipId();

  /// Reads the two blink lists, the red one first. Throws mblib_exception for an entry that cannot be used.
  virtual void LoadBlinkLists();

  /// The number by which the LED pin map register names a GPIO line; 255 for a line that it cannot drive.
  virtual std::uint8_t MapGpioLine(int line);

 protected:
  explicit GIteChip(std::string chipName) : GSioChip(std::move(chipName)) {}

 private:
  PairList ParseBlinkList(const std::string& key);
  std::uint8_t BlinkValue(const std::string& token, const std::string& key, const Setting& setting);

  std::array<std::uint8_t, 3> pwmControlRegs{};  // "fan.<n>.pwm_ctl.reg"
  int primaryLine = 22;                          // GPIO line of the LED's first colour
  int secondaryLine = 23;                        // ... and of its second
  PairList redBlink;
  PairList greenBlink;
};

}  // namespace panelglow
