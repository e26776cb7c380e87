#include "board/chips/fin/FinF71855Chip.h"

namespace panelglow {

namespace {

constexpr RegisterId kLedMode{1, 0xF9};
constexpr RegisterId kFanMode{0, 0x96};  // of the hardware monitor

}  // namespace

FinF71855Chip::FinF71855Chip() : FinCurveChip("fin_f71855") {
  ReadKeys({"chip.fin_f71855.", 0x800, 0x295, 0x2E, 0x32, 0x23});
  fans.saved = WithCurves({kFanMode.reg, 0xD0, 0xD1}, {0xA6, 0xB6, 0xC6}, 11);
  fans.manual = {Put(kFanMode, 0x15)};
  takesAllFans = true;
  zones.zones = RegistersAt(0, {0x70, 0x72, 0x74, 0x75, 0x7F});
  // Neither lit nor put out by hand: the mode register has blinking colours alone.
  led = {.saved = {kLedMode},
         .blinkGreen = Steps{Put(kLedMode, green)},
         .blinkRed = Steps{Put(kLedMode, red)},
         .isRedSupported = true};
}

}  // namespace panelglow
