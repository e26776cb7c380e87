#include "board/chips/fin/FinF71808eChip.h"

namespace panelglow {

namespace {

// LED pins, in their logical device.
constexpr RegisterId kLedMode1{10, 0xF8};
constexpr RegisterId kLedMode2{10, 0xF9};

}  // namespace

FinF71808eChip::FinF71808eChip() : FinF71858Chip("fin_f71808e") {
  ReadKeys({"chip.fin_f71808e.", 0x800, 0xA05, 0x2E, 0x01, 0x01});
  led = {.saved = {kLedMode2, kLedMode1},
         .green = Steps{Put(kLedMode1, green), Put(kLedMode2, 0)},
         .red = Steps{Put(kLedMode1, 0), Put(kLedMode2, red)},
         .off = Steps{Put(kLedMode1, 0), Put(kLedMode2, 0)},
         .isRedSupported = true};
}

}  // namespace panelglow
