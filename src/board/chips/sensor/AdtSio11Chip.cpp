#include "board/chips/sensor/AdtSio11Chip.h"

namespace panelglow {

AdtSio11Chip::AdtSio11Chip() : AdtChip("adt_sio11") {
  ReadKeys("chip.adt_sio11.", 0x800, 0x5C);
  for (const RegisterId id : RegistersAt(0, {0x64, 0x65, 0x66, 0x38, 0x39, 0x3A})) {
    fans.saved.push_back(id);
  }
}

int AdtSio11Chip::ReadRegister(int reg) {
  if (reg < 0 || reg > 0xFF) {
    return 0;
  }
  hasFailed = false;
  const int value = ReadMonitor(static_cast<std::uint8_t>(reg));
  return hasFailed ? 0 : value;
}

}  // namespace panelglow
