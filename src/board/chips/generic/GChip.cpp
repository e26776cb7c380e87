#include "board/chips/generic/GChip.h"

#include "board/base/IniReader.h"
#include "board/parts/Sequence.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kFullSpeed = 255;
constexpr std::uint32_t kMostNumberedKeys = 256;  // a list without end in a file is not walked without end

}  // namespace

void GChip::LoadConfiguration() {
  if (section.empty()) {
    section = ReadIniValue("chip." + name + ".data", name);
  }
  LoadFanConfiguration();
  LoadTemperatureConfiguration();
  LoadPowerLedConfiguration();
}

template <class Number>
std::vector<Number> GChip::ReadNumberedList(const std::string& countKey, const std::string& prefix,
                                            const std::string& suffix) const {
  IniReader& reader = IniReader::Instance();
  IniReader::status_t status = IniReader::kNotFound;
  const std::uint32_t count = ReadChipDword(section, countKey, 0);
  const std::uint32_t last = count != 0 && count < kMostNumberedKeys ? count : kMostNumberedKeys;
  std::vector<Number> numbers;
  for (std::uint32_t n = 1; n <= last; ++n) {
    const std::string key = prefix + "." + CDMUtil::ToString(n) + "." + suffix;
    const int number = reader.ReadChipInt(section, key, status, 0, 8 * sizeof(Number));
    if (number == 0) {
      break;
    }
    numbers.push_back(static_cast<Number>(number));
  }
  return numbers;
}

void GChip::LoadFanConfiguration() {
  fanSaveRegs = ParseByteList(ReadChipSetting(section, "fan.save.regs", ""));
  fanRestoreSleep = ReadChipDword(section, "fan.restore_sleep", 0);
  tachRegs = ReadNumberedList<std::uint32_t>("fan.tachs", "fan", "tach.reg");
  pwmRegs = ReadNumberedList<std::uint16_t>("fan.pwms", "fan", "pwm.reg");
  fullSpeedData = ReadChipByte(section, "fan.full_speed.data", kFullSpeed);
}

void GChip::LoadTemperatureConfiguration() {
  tempReadRegs = ReadNumberedList<std::uint16_t>("temp.zones", "temp", "read.reg");
  tempLimitRegs = ReadNumberedList<std::uint16_t>("temp.zones", "temp", "limit.reg");
}

void GChip::LoadPowerLedConfiguration() {
  powerLedLdn = ReadChipByte(section, "powerled.ldn", 0);
  powerLedStateRegs = ParseByteList(ReadChipSetting(section, "powerled.state.regs", ""));
}

bool GChip::SetManualFanMode(bool on) {
  if (on && !manualFanMode) {
    const bool saved = SaveFanState();
    const bool entered = EnterManualFanMode();
    manualFanMode = true;
    return saved || entered;
  }
  if (!on && manualFanMode) {
    const bool left = LeaveManualFanMode();
    const bool restored = RestoreFanState();
    manualFanMode = false;
    return left || restored;
  }
  return false;
}

bool GChip::SetFanFullSpeed(int fan) {
  SaveFanState();
  SetManualFanMode(true);
  if (fan > 0) {
    return SetFanPwm(fan, fullSpeedData);
  }
  bool all = true;
  for (int each = 1; each <= static_cast<int>(pwmRegs.size()); ++each) {
    all = SetFanPwm(each, fullSpeedData) && all;
  }
  return all;
}

bool GChip::SetFanPwmPercent(int fan, int percent) {
  return SetFanPwm(fan, static_cast<int>(std::int64_t{percent} * fullSpeedData / 100));
}

}  // namespace panelglow
