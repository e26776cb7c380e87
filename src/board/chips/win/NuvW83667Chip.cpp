#include "board/chips/win/NuvW83667Chip.h"

#include <utility>

namespace panelglow {

namespace {

// Configuration registers: GPIO groups 3 and 5 drive the LED.
constexpr RegisterId kActivate{9, 0x30};
constexpr RegisterId kGroup3Direction{9, 0xE4};
constexpr RegisterId kGroup3Data{9, 0xE5};
constexpr RegisterId kGroup3Function{9, 0xEA};
constexpr RegisterId kGroup5Data{9, 0xF5};
constexpr RegisterId kBlink{0x0D, 0xEC};

// Hardware monitor.
constexpr RegisterId kFanMode{0, 0x04};
constexpr RegisterId kSmartFan1{0x09, 0x50};
constexpr RegisterId kSmartFan2{0x0A, 0x50};

}  // namespace

NuvW83667Chip::NuvW83667Chip() : NuvW83667Chip("nuv_w83667") {}

NuvW83667Chip::NuvW83667Chip(std::string chipName) : WinChip(std::move(chipName)) {
  ReadKeys({"chip.nuv_w83667.", 0x2000, 0x295, 0x4E});
  // Group 1 has device 8, groups 2 to 5 device 9, the others device 7. A line of groups 2 to 5 that is read leaves
  // the activation register of device 9 with that group's bit alone; it is one of the LED's, too, and what the LED
  // saved puts it back.
  ReadGroups({{{8, 1, 0xF0, 0xF1, 0xF2, 0xF3},
               {9, 0, 0xE0, 0xE1, 0xE2, 0xE3},
               {9, 1, 0xE4, 0xE5, 0xE6, 0xE7},
               {9, 2, 0xF0, 0xF1, 0xF2, 0xE8},
               {9, 3, 0xF4, 0xF5, 0xF6, 0xF7},
               {7, 1, 0xF4, 0xF5, 0xF6, 0xF7},
               {7, 2, 0xE0, 0xE1, 0xE2, 0xE3},
               {7, 3, 0xE4, 0xE5, 0xE6, 0xE7},
               {7, 4, 0xE8, 0xE9, 0xEA, 0xEB}}});
  fans.saved.push_back(kSmartFan1);
  fans.saved.push_back(kSmartFan2);
  fans.manual = {Change(kFanMode, 0xCF, 0), Change(kFanMode, 0xF3, 0), ClearBits(kSmartFan1, 0x01),
                 ClearBits(kSmartFan2, 0x01)};
  sensors[0] = {{0, 0x7D}, RegisterId{0, 0x7E}};
  led = {.saved = {kActivate, kGroup3Direction, kGroup3Function, kBlink, kGroup3Data, kGroup5Data},
         .green =
             Steps{Put(kActivate, 0x0A), Put(kGroup3Direction, 0x7F), Put(kGroup3Function, 0x80), Put(kBlink, 0xA1)},
         .red = Steps{Put(kGroup3Data, 0), Put(kGroup5Data, 1), Put(kGroup3Function, 0x80), Put(kBlink, 0xA1)},
         .off = Steps{}};
}

}  // namespace panelglow
