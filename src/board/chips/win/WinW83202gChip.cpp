#include "board/chips/win/WinW83202gChip.h"

namespace panelglow {

namespace {

// Configuration registers.
constexpr RegisterId kActivate{9, 0x30};
constexpr RegisterId kGroup4Direction{9, 0xF0};
constexpr RegisterId kLed{9, 0xF3};
constexpr RegisterId kLedOption1{9, 0xF9};
constexpr RegisterId kLedOption2{9, 0xFA};
constexpr RegisterId kButtonOption{10, 0xE9};

// Hardware monitor.
constexpr RegisterId kFanMode{0, 0x5E};
constexpr RegisterId kFanOutput{0, 0x75};

}  // namespace

WinW83202gChip::WinW83202gChip() : WinChip("win_w83202g") {
  ReadKeys({"chip.win_w83202g.", 0x400, 0x295, 0x4E});
  counters.erase(counters.begin(), counters.end() - 1);  // the base's fan 4 is fan 1 here
  fans.duties = RegistersAt(0, {0x61});
  fans.saved = {kFanMode, kFanOutput};
  fans.manual = {Put(kFanMode, 0), Put(kFanOutput, 2)};
  buttonOption = kButtonOption;
  led = {.saved = {kLed, kActivate, kLedOption2, kLedOption1, kGroup4Direction},
         .green = Steps{Put(kLed, 0x29)},
         .red = Steps{Put(kActivate, 0x0B), Put(kLedOption2, 0), Put(kLedOption1, 0x10), Put(kGroup4Direction, 0xEF),
                      Put(kLed, 0x29)},
         .off = Steps{Put(kLed, 0x09)}};
}

}  // namespace panelglow
