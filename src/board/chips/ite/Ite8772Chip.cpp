#include "board/chips/ite/Ite8772Chip.h"

namespace panelglow {

namespace {

// Hardware monitor.
constexpr RegisterId kControl2{0, 0x16};
constexpr RegisterId kControl3{0, 0x17};
constexpr RegisterId kDuty2{0, 0x6B};
constexpr RegisterId kDuty3{0, 0x73};
constexpr std::uint8_t kManual = 0x3F;  // bits of a control that stay: the others make it automatic

}  // namespace

Ite8772Chip::Ite8772Chip() : Ite8758Chip("ite_8772") {
  ReadBases("chip.ite_8772.");
  Identify();
  // Whatever the part's id: none of this class obeys its duty registers before it is told.
  fans = {.firstFan = 2,
          .tachs = {{{0, 0x0E}, {0, 0x19}}, {{0, 0x0F}, {0, 0x1A}}},  // low byte, high byte
          .badTachText = "***** ITE_8772 error: invalid fan index %d (only 2,3 supported)",
          .duties = {kDuty2, kDuty3},
          .badDutyText = "\n***** ITE_8772 error: invalid fan index %d\n",
          .saved = {kControl2, kDuty2, kControl3, kDuty3},
          .manual = {FromSaved(kControl2, kManual, 0), FromSaved(kControl3, kManual, 0)},
          .restoreWait_ms = 2500};
  led.saved = {kGpioSet2, kLed1Map, kLed1Control, kLed2Map, kLed2Control};
  led.blinkGreen = Steps{Put(kGpioSet2, kLedPins), Put(kLed1Map, primary), Put(kLed1Control, kOneHertz)};
  led.blinkRed = Steps{Put(kGpioSet2, kLedPins), Put(kLed1Map, primary), Put(kLed1Control, 0x03),
                       Put(kLed2Map, secondary), Put(kLed2Control, kOneHertz)};
}

}  // namespace panelglow
