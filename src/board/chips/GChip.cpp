#include "board/chips/GChip.h"

#include "board/base/IniReader.h"
#include "board/chips/Sequence.h"
#include "harness/base/CDMUtil.h"

namespace panelglow {

namespace {

constexpr int kFullSpeed = 255;
constexpr std::uint32_t kMostNumberedKeys = 256;  // a list without end in a file is not walked without end

std::vector<std::uint16_t> Words(const std::vector<std::uint32_t>& numbers) {
  std::vector<std::uint16_t> words;
  words.reserve(numbers.size());
  for (const std::uint32_t number : numbers) {
    words.push_back(static_cast<std::uint16_t>(number));
  }
  return words;
}

}  // namespace

void GChip::LoadConfiguration() {
  if (section.empty()) {
    section = ReadIniValue("chip." + name + ".data", name);
  }
  LoadFanConfiguration();
  LoadTemperatureConfiguration();
  LoadPowerLedConfiguration();
}

std::vector<std::uint32_t> GChip::ReadNumberedList(const std::string& countKey, const std::string& prefix,
                                                   const std::string& suffix) const {
  const auto count = static_cast<std::uint32_t>(ReadChipInt(section, countKey, 0));
  const std::uint32_t last = count != 0 && count < kMostNumberedKeys ? count : kMostNumberedKeys;
  std::vector<std::uint32_t> numbers;
  for (std::uint32_t n = 1; n <= last; ++n) {
    const int number = ReadChipInt(section, prefix + "." + CDMUtil::ToString(n) + "." + suffix, 0);
    if (number == 0) {
      break;
    }
    numbers.push_back(static_cast<std::uint32_t>(number));
  }
  return numbers;
}

void GChip::LoadFanConfiguration() {
  fanSaveRegs = ParseByteList(ReadChipValue(section, "fan.save.regs", ""));
  fanRestoreSleep = static_cast<std::uint32_t>(ReadChipInt(section, "fan.restore_sleep", 0));
  tachRegs = ReadNumberedList("fan.tachs", "fan", "tach.reg");
  pwmRegs = Words(ReadNumberedList("fan.pwms", "fan", "pwm.reg"));
  fullSpeedData = static_cast<std::uint8_t>(ReadChipInt(section, "fan.full_speed.data", kFullSpeed));
}

void GChip::LoadTemperatureConfiguration() {
  tempReadRegs = Words(ReadNumberedList("temp.zones", "temp", "read.reg"));
  tempLimitRegs = Words(ReadNumberedList("temp.zones", "temp", "limit.reg"));
}

void GChip::LoadPowerLedConfiguration() {
  powerLedLdn = static_cast<std::uint8_t>(ReadChipInt(section, "powerled.ldn", 0));
  powerLedStateRegs = ParseByteList(ReadChipValue(section, "powerled.state.regs", ""));
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

bool GChip::SetFanPwmPercent(int fan, int percent) { return SetFanPwm(fan, percent * fullSpeedData / 100); }

std::uint8_t GChip::ReadPort(std::uint16_t base, std::uint16_t offset) {
  return devio.InportByte(static_cast<std::uint16_t>(base + offset));
}

std::uint8_t GChip::ReadIndexed(std::uint16_t indexPort, std::uint8_t reg) {
  devio.OutportByte(indexPort, reg);
  return devio.InportByte(static_cast<std::uint16_t>(indexPort + 1));
}

void GChip::WriteIndexed(std::uint16_t indexPort, std::uint8_t reg, std::uint8_t value) {
  devio.OutportByte(indexPort, reg);
  devio.OutportByte(static_cast<std::uint16_t>(indexPort + 1), value);
}

}  // namespace panelglow
