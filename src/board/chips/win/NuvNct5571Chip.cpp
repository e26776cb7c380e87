#include "board/chips/win/NuvNct5571Chip.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kBit1 = 0x02;
constexpr std::uint8_t kBit3 = 0x08;

// Configuration registers of the GPIO groups with the LED.
constexpr RegisterId kFunction{9, 0xEB};
constexpr RegisterId kGroup5Direction{9, 0xF4};
constexpr RegisterId kGroup5Data{9, 0xF5};
constexpr RegisterId kGroup2Data{9, 0xE1};

// Of the LED device; the second is shared, and reached with that device selected.
constexpr RegisterId kBlink{0x0D, 0xEC};
constexpr RegisterId kMultiFunction{0x0D, 0x2D};

// Hardware monitor.
constexpr RegisterId kFanMode{0, 0x04};
constexpr RegisterId kFan3Mode{0, 0x12};

}  // namespace

NuvNct5571Chip::NuvNct5571Chip() : NuvW83667Chip("nuv_nct5571") {
  ReadKeys({"chip.nuvo5571.", 0x4000, 0xA10, 0x4E});
  // The GPIO groups stay the base's: the part has them in the same registers, as the LED's below show.
  counters.resize(3);
  fans.duties = RegistersAt(0, {0x01, 0x03, 0x11});
  fans.saved = RegistersAt(0, {0x04, 0x12, 0x01, 0x03, 0x11});
  fans.manual = {Change(kFanMode, 0xC3, 0), Change(kFan3Mode, 0xF9, 0)};
  led = {.saved = {kFunction, kGroup5Direction, kGroup5Data, kGroup2Data, kBlink, kMultiFunction},
         .green = Steps{Put(kBlink, 0x11), ClearBits(kMultiFunction, kBit3)},
         .red = Steps{ClearBits(kFunction, kBit3), ClearBits(kGroup5Direction, kBit3), SetBits(kGroup5Data, kBit3),
                      SetBits(kGroup2Data, kBit1)},
         .off = Steps{ClearBits(kFunction, kBit3), ClearBits(kGroup5Direction, kBit3), SetBits(kGroup5Data, kBit3),
                      ClearBits(kGroup2Data, kBit1), Put(kBlink, 0x31), ClearBits(kMultiFunction, kBit3)}};
}

}  // namespace panelglow
