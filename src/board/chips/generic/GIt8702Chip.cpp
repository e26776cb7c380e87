#include "board/chips/generic/GIt8702Chip.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/NumberedLists.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kKeepAll = 0xFF;
constexpr std::uint8_t kFansOn = 0x70;        // of the fan main control register: tachometers 1 to 3
constexpr std::uint8_t kNoFanControl = 0xF7;  // of the fan control register
constexpr std::uint8_t kNoRamp = 0x3F;        // of the ramp rate register
constexpr std::uint8_t kStart = 0x01;         // of the configuration register: the monitor runs
constexpr std::uint8_t kStopped = 0xFE;

}  // namespace

void GIt8702Chip::Initialize() {
  GIteChip::Initialize();
  const auto readRegister = [this](const char* key) { return ReadChipByte(section, key, 0); };
  configReg = readRegister("config.reg");
  fanMainControlReg = readRegister("fan_main_control.reg");
  fanControlReg = readRegister("fan_ctl.reg");
  fanRampRateReg = readRegister("fan_ramp_rate.reg");
}

void GIt8702Chip::Change(std::uint8_t reg, std::uint8_t keep, std::uint8_t set) {
  WriteEnvRegister(reg, static_cast<std::uint8_t>((ReadEnvRegister(reg) & keep) | set));
}

bool GIt8702Chip::EnterManualFanMode() {
  Change(fanMainControlReg, kKeepAll, kFansOn);
  Change(fanControlReg, kNoFanControl, 0);
  Change(fanRampRateReg, kNoRamp, 0);
  Change(configReg, kStopped, 0);
  return true;
}

std::string GIt8702Chip::FanIntegrityText() const {
  return "restore fan state integrity check: saved fan reg list size (";
}

bool GIt8702Chip::RestoreFanState() {
  if (savedFanData.empty()) {
    return true;
  }
  CheckFanIntegrity();
  for (std::size_t i = savedFanData.size(); i-- > 1;) {
    WriteSavedFanRegister(i);
  }
  WriteEnvRegister(fanSaveRegs.front(), savedFanData.front() | kStart);
  savedFanData.clear();
  if (fanRestoreSleep != 0) {
    platform::TheHost().clock.Sleep(fanRestoreSleep);
  }
  return true;
}

bool GIt8702Chip::SetFanPwm(int fan, int value) {
  const std::uint16_t reg = FanPwmEntry(pwmRegs, fan);
  WriteEnvRegister(LowByte(reg), LowByte(static_cast<std::uint32_t>(std::clamp<int>(value, 0, fullSpeedData) / 2)));
  return true;
}

}  // namespace panelglow
