#include "board/chips/ite/Ite8758Chip.h"

#include <algorithm>
#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"

namespace panelglow {

namespace {

constexpr std::uint16_t kConfigPort = 0x2E;

// Global configuration registers.
constexpr RegisterId kChipId1{ConfigRegisters::kGlobal, 0x20};
constexpr RegisterId kChipId2{ConfigRegisters::kGlobal, 0x21};
constexpr RegisterId kChipVersion{ConfigRegisters::kGlobal, 0x22};
constexpr std::uint16_t kManualByNature = 0x2005;  // second id and version

// Hardware monitor.
constexpr RegisterId kControl1{0, 0x15};
constexpr RegisterId kControl2{0, 0x16};
constexpr RegisterId kControl3{0, 0x17};
constexpr RegisterId kDuty1{0, 0x63};
constexpr RegisterId kDuty2{0, 0x6B};
constexpr RegisterId kDuty3{0, 0x73};
constexpr std::uint8_t kManual = 0x3F;  // bits of a control that stay: the others make it automatic

}  // namespace

Ite8758Chip::Ite8758Chip() : Ite8758Chip("ite_8758") { Identify(); }

Ite8758Chip::Ite8758Chip(std::string chipName) : IteChip(std::move(chipName)) {
  ReadBases("chip.ite_8758.");
  fans.tachs.resize(3);
  fans.badTachText = "\n***** ITE_8758 error: invalid fan index %d\n";
  fans.duties = {kDuty1, kDuty2, kDuty3};
  fans.saved = {kControl1, kDuty1, kControl2, kDuty2, kControl3, kDuty3};
  fans.restored.clear();  // as saved
  fans.manual = {FromSaved(kControl1, kManual, 0), FromSaved(kControl2, kManual, 0),
                 FromSaved(kControl3, kManual, 0)};
  led.saved = {kLed1Map, kLed1Control};
  led.red = Steps{Put(kLed1Map, secondary), Put(kLed1Control, kOneHertz)};
}

void Ite8758Chip::ReadBases(const std::string& prefix) {
  ReadMonitorBase(prefix);
  config = IteConfigRegisters(devio, ReadIniWord(prefix + "cfgbar", kConfigPort));
}

void Ite8758Chip::Identify() {
  const ConfigMode mode(config);
  config.Read(kChipId1);  // says no more than that the part is one of the line
  const std::uint8_t id = config.Read(kChipId2);
  if (WordOf(id, config.Read(kChipVersion)) == kManualByNature) {
    fans.manual.clear();
  }
}

std::uint8_t Ite8758Chip::DutyOf(int value) const { return static_cast<std::uint8_t>(std::clamp(value, 0, 255)); }

}  // namespace panelglow
