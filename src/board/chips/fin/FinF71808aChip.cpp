#include "board/chips/fin/FinF71808aChip.h"

namespace panelglow {

namespace {

// Hardware monitor.
constexpr RegisterId kFanType{0, 0x96};
constexpr RegisterId kFanMode{0, 0x9F};

// LED pins, in their logical device.
constexpr RegisterId kLedMode1{10, 0xF8};
constexpr RegisterId kLedMode2{10, 0xF9};

}  // namespace

FinF71808aChip::FinF71808aChip() : FinChip("fin_f71808a") {
  ReadKeys({"chip.fin_f71808a.", 0x800, 0xA05, 0x2E, 0xC0, 0x02});
  fans.saved = {kFanMode, {0, 0xA3}, {0, 0xB3}};
  fans.manual = {Put(kFanMode, 0), Put(kFanType, 3)};
  led = {.saved = {kLedMode2, kLedMode1},
         .green = Steps{Put(kLedMode2, green)},
         .red = Steps{Put(kLedMode2, 4), Put(kLedMode1, red)},
         .off = Steps{Put(kLedMode1, 0), Put(kLedMode2, 0)},
         .isRedSupported = true};
}

bool FinF71808aChip::RestoreFanState() {
  if (savedFans.Holds()) {
    monitor.Write(kFanType, 5);
  }
  return FinChip::RestoreFanState();
}

}  // namespace panelglow
