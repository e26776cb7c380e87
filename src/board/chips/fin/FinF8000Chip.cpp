#include "board/chips/fin/FinF8000Chip.h"

namespace panelglow {

namespace {

constexpr RegisterId kMultiFunctionSelect2{ConfigRegisters::kGlobal, 0x2A};
constexpr RegisterId kFanMode{0, 0x96};  // of the hardware monitor

}  // namespace

FinF8000Chip::FinF8000Chip() : FinCurveChip("fin_f8000") {
  ReadKeys({"chip.fin_f8000.", 0x800, 0xA05, 0x4E, 0x54, 0x45, 0x20});
  ReadSelectKeys();
  fans.saved = WithCurves({kFanMode.reg}, {0xA6, 0xB6, 0xC6}, 10);
  fans.manual = {FromSaved(kFanMode, 0xF0, 0x05)};
  zones.zones = RegistersAt(0, {0x70, 0x72, 0x74});
  // The LED keeps its colour when it is told to go out.
  led = {.saved = {kMultiFunctionSelect2},
         .green = Steps{Put(kMultiFunctionSelect2, green)},
         .red = Steps{Put(kMultiFunctionSelect2, red)},
         .off = Steps{},
         .isRedSupported = true};
}

bool FinF8000Chip::RestoreFanState() {
  if (savedFans.Holds()) {
    for (const RegisterId id : fans.saved) {
      monitor.Write(id, savedFans.At(id));
      savedFans.Set(id, monitor.Read(id));
    }
    manualFanMode = false;
  }
  return true;
}

}  // namespace panelglow
