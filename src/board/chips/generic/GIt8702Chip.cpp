#include "board/chips/generic/GIt8702Chip.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/NumberedLists.h"
#include "board/parts/Step.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kFansOn = 0x70;      // of the fan main control register: tachometers 1 to 3
constexpr std::uint8_t kFanControl = 0x08;  // of the fan control register
constexpr std::uint8_t kRamp = 0xC0;        // of the ramp rate register
constexpr std::uint8_t kStart = 0x01;       // of the configuration register: the monitor runs

}  // namespace

void GIt8702Chip::Initialize() {
  GIteChip::Initialize();
  const auto readRegister = [this](const char* key) { return ReadChipByte(section, key, 0); };
  configReg = readRegister("config.reg");
  fanMainControlReg = readRegister("fan_main_control.reg");
  fanControlReg = readRegister("fan_ctl.reg");
  fanRampRateReg = readRegister("fan_ramp_rate.reg");
}

bool GIt8702Chip::EnterManualFanMode() {
  Run(Steps{SetBits({0, fanMainControlReg}, kFansOn), ClearBits({0, fanControlReg}, kFanControl),
            ClearBits({0, fanRampRateReg}, kRamp), ClearBits({0, configReg}, kStart)},
      environment);
  return true;
}

std::string GIt8702Chip::FanIntegrityText() const {
  return "restore fan state integrity check: saved fan reg list size (";
}

bool GIt8702Chip::RestoreFanState() {
  if (savedFans.Holds()) {
    CheckFanIntegrity();
    const RegisterId starter{0, fanSaveRegs.front()};
    savedFans.Restore(environment, RegistersAt(0, {fanSaveRegs.rbegin(), fanSaveRegs.rend() - 1}));
    environment.Write(starter, savedFans.At(starter) | kStart);
    EndFanRestore();
  }
  return true;
}

bool GIt8702Chip::SetFanPwm(int fan, int value) {
  const std::uint16_t reg = FanPwmEntry(pwmRegs, fan);
  WriteEnvRegister(LowByte(reg), LowByte(static_cast<std::uint32_t>(std::clamp<int>(value, 0, fullSpeedData) / 2)));
  return true;
}

}  // namespace panelglow
