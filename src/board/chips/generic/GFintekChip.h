// A generic Super-I/O of the Fintek line: fan modes by a list of register writes, GPIO levels in configuration
// registers, a power LED that it blinks by itself. Serves the chip name "g_fintek".
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "board/base/Setting.h"
#include "board/chips/generic/GSioChip.h"

namespace panelglow {

class GFintekChip : public GSioChip {
 public:
  using GSioChip::PairList;

  GFintekChip() : GSioChip("g_fintek") {}

  void Initialize() override;
  bool EnterManualFanMode() override;
  bool ReadFanRpm(int fan, int& rpm, int multiplier) override;
  int TachToRpm(std::uint32_t raw, int multiplier) override;
  bool ReadIntrusionLatch(int line, bool clearFirst, bool& value) override;
  int ReadLine(int line) override;

  bool BlinkPowerLedGreen() override { return RunBlinkList(greenBlink); }
  bool BlinkPowerLedRed() override { return RunBlinkList(redBlink); }

  /// Reads the two blink lists, the red one first.
  virtual void LoadBlinkLists();

  /// The configuration register and the bit mask of a GPIO line's level; false for a line that the part lacks.
  virtual bool MapGpioLine(int line, std::uint8_t& reg, std::uint8_t& mask);

  /// "register:value,..."; "undef" is an empty list. Throws mblib_exception for an entry of another form.
  virtual void ParsePairList(const Setting& setting, PairList& list);

  /// Writes environment registers in order.
  virtual bool RunPairList(const PairList& list);

 private:
  PairList manualModeSet;
  PairList redBlink;
  PairList greenBlink;
};

}  // namespace panelglow
