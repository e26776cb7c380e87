#include "board/chips/generic/GSioChip.h"

#include <algorithm>
#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/LevelPorts.h"
#include "board/parts/NumberedLists.h"
#include "board/parts/ReadBase.h"
#include "board/parts/RpmOf.h"
#include "board/parts/Sequence.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kLogicalDeviceNumber = 0x07;  // configuration register that selects the logical device

// Base address registers as the common parts have them: high byte's register, low byte's register.
constexpr int kHwmLdn = 4;
constexpr int kHwmBarReg = 0x6061;
constexpr std::uint8_t kGpioLdn = 7;
constexpr int kGpioBarReg = 0x6263;

constexpr std::int64_t kTachClock = 1'350'000;
constexpr int kHottest = 126;  // a raw temperature from here on is no temperature
constexpr int kNoTemperature = 255;

}  // namespace

// The keys of a base address, and what it says when the part does not have one.
struct GSioChip::BarKeys {
  const char* address;
  const char* ldn;
  int defaultLdn;
  const char* reg;
  int defaultReg;
  const char* failure;
};

void GSioChip::Initialize() {
  LoadConfiguration();
  indexPort = ReadChipByte(section, "config.index.port", 0);
  dataPort = ReadChipByte(section, "config.data.port", 0);
  enterSequence = ParseByteList(ReadChipSetting(section, "config.mode.enter.sequence", ""));
  exitSequence = ParseByteList(ReadChipSetting(section, "config.mode.exit.sequence", ""));
  hwmBar =
      FindBar({"hwmbar", "hwmbar.bar.ldn", kHwmLdn, "hwmbar.bar.reg", kHwmBarReg, "could not read HWMBAR from SIO"});
  envIndexReg = ReadChipByte(section, "environment.index.reg", 0);
  envDataReg = ReadChipByte(section, "environment.data.reg", 0);
  gpioLdn = ReadChipByte(section, "gpiobar.bar.ldn", kGpioLdn);
  gpioBar = FindBar(
      {"gpiobar", "gpiobar.bar.ldn", kGpioLdn, "gpiobar.bar.reg", kGpioBarReg, "could not read GPIOBAR from SIO"});
}

// The file's address; without one, what the part's own base address register holds. "undef" anywhere means none.
std::uint16_t GSioChip::FindBar(const BarKeys& keys) {
  IniReader& reader = IniReader::Instance();
  IniReader::status_t status = IniReader::kNotFound;
  const int address = reader.ReadChipInt(section, keys.address, status, 0, 16);
  if (status != IniReader::kNotFound) {
    return static_cast<std::uint16_t>(address);
  }
  IniReader::status_t ldnStatus = IniReader::kNotFound;
  IniReader::status_t regStatus = IniReader::kNotFound;
  const int ldn = reader.ReadChipInt(section, keys.ldn, ldnStatus, keys.defaultLdn, 8);
  const auto registers =
      static_cast<std::uint32_t>(reader.ReadChipInt(section, keys.reg, regStatus, keys.defaultReg, 16));
  if (ldnStatus == IniReader::kUndefined || regStatus == IniReader::kUndefined) {
    return 0;
  }
  if (!HasConfigPorts()) {
    return 0;
  }
  std::uint16_t bar = 0;
  {
    const ConfigMode mode(*this);
    SelectLogicalDevice(LowByte(static_cast<std::uint32_t>(ldn)));
    const std::uint8_t high = ReadConfigRegister(HighByte(registers));
    bar = WordOf(high, ReadConfigRegister(LowByte(registers)));
  }
  if (bar == 0) {
    throw mblib_exception(keys.failure);
  }
  return bar;
}

// ---- the part's protocol

void GSioChip::EnterConfigMode() { ConfigPorts().Send(enterSequence); }

void GSioChip::ExitConfigMode() { ConfigPorts().Send(exitSequence); }

void GSioChip::SelectLogicalDevice(std::uint8_t ldn) { WriteConfigRegister(kLogicalDeviceNumber, ldn); }

std::uint8_t GSioChip::ReadConfigRegister(std::uint8_t reg) { return ConfigPorts().Read(reg); }

void GSioChip::WriteConfigRegister(std::uint8_t reg, std::uint8_t value) { ConfigPorts().Write(reg, value); }

IndexedPorts GSioChip::EnvPorts() const {
  return {devio, static_cast<std::uint16_t>(hwmBar + envIndexReg), static_cast<std::uint16_t>(hwmBar + envDataReg)};
}

// Without a base the ports would be those of other parts.
std::uint8_t GSioChip::ReadEnvRegister(std::uint8_t reg) {
  constexpr std::uint8_t kNobody = 0xFF;
  return IsBase(hwmBar) ? EnvPorts().Read(reg) : kNobody;
}

void GSioChip::WriteEnvRegister(std::uint8_t reg, std::uint8_t value) {
  if (IsBase(hwmBar)) {
    EnvPorts().Write(reg, value);
  }
}

// ---- fans

bool GSioChip::SaveFanState() {
  savedFans.SaveOnce(environment, RegistersAt(0, fanSaveRegs));
  return true;
}

std::string GSioChip::FanIntegrityText() const {
  return "fan state restore integrity check failed: fan reg list size (";
}

void GSioChip::CheckFanIntegrity() const {
  if (savedFans.Count() != fanSaveRegs.size()) {
    throw mblib_exception(FanIntegrityText() + std::to_string(fanSaveRegs.size()) +
                          ") differs from saved data list size (" + std::to_string(savedFans.Count()) + ")");
  }
}

bool GSioChip::RestoreFanState() {
  if (savedFans.Holds()) {
    CheckFanIntegrity();
    savedFans.Restore(environment, RegistersAt(0, {fanSaveRegs.rbegin(), fanSaveRegs.rend()}));
    EndFanRestore();
  }
  return true;
}

void GSioChip::EndFanRestore() {
  savedFans.Forget();
  if (fanRestoreSleep != 0) {
    platform::TheHost().clock.Sleep(fanRestoreSleep);
  }
}

// A tach entry holds the low byte's register in its low byte, the high byte's register in the next.
std::uint32_t GSioChip::ReadFanTach(int fan, int /*arg*/) {
  const std::uint32_t registers = FanTachEntry(tachRegs, fan);
  const std::uint8_t high = ReadEnvRegister(HighByte(registers));
  return WordOf(high, ReadEnvRegister(LowByte(registers)));
}

int GSioChip::TachToRpm(std::uint32_t raw, int multiplier) {
  return RpmOf(multiplier * kTachClock, std::min(raw, kTachStopped) * 2, kTachStopped * 2);
}

bool GSioChip::SetFanPwm(int fan, int value) {
  const std::uint16_t reg = FanPwmEntry(pwmRegs, fan);
  WriteEnvRegister(LowByte(reg), LowByte(static_cast<std::uint32_t>(std::clamp<int>(value, 0, fullSpeedData))));
  return true;
}

// ---- temperatures and lines

bool GSioChip::ReadTemperature(int zone, int& value) {
  value = ReadEnvRegister(LowByte(TemperatureEntry(tempReadRegs, zone)));
  return true;
}

bool GSioChip::ReadLowLimitTemperature(int zone, int& value) {
  const std::uint16_t registers = LowLimitEntry(tempLimitRegs, zone);
  const std::uint8_t high = ReadEnvRegister(HighByte(registers));
  value = WordOf(high, ReadEnvRegister(LowByte(registers)));
  return true;
}

int GSioChip::MapTemperature(int raw) { return raw < kHottest ? raw : kNoTemperature; }

int GSioChip::ReadLine(int line) { return IsBase(gpioBar) ? ReadLevelLine(devio, gpioBar, line) : kNoSuchLineState; }

// ---- power LED

bool GSioChip::IsPowerLedRedSupported(bool& supported) {
  supported = true;
  return true;
}

bool GSioChip::SavePowerLedState() {
  if (!HasConfigPorts()) {
    return false;
  }
  if (!savedPowerLed.Holds()) {
    const ConfigMode mode(*this);
    SelectLogicalDevice(powerLedLdn);
    savedPowerLed.SaveOnce(config, RegistersAt(powerLedLdn, powerLedStateRegs));
  }
  return savedPowerLed.Count() == powerLedStateRegs.size();
}

bool GSioChip::RestorePowerLedState() {
  if (!savedPowerLed.Holds()) {
    return true;
  }
  if (savedPowerLed.Count() != powerLedStateRegs.size()) {
    throw mblib_exception("power LED state restore inegrity check: power led state reg list size (" +
                          std::to_string(powerLedStateRegs.size()) + ") differs from saved data list size (" +
                          std::to_string(savedPowerLed.Count()) + ")");
  }
  {
    const ConfigMode mode(*this);
    SelectLogicalDevice(powerLedLdn);
    savedPowerLed.Restore(config, RegistersAt(powerLedLdn, powerLedStateRegs));
  }
  savedPowerLed.Forget();
  return true;
}

Steps GSioChip::StepsOf(const PairList& list) {
  Steps steps;
  for (const auto& [reg, value] : list) {
    steps.push_back(Put({0, reg}, value));
  }
  return steps;
}

bool GSioChip::RunBlinkList(const PairList& list) {
  if (list.empty() || !HasConfigPorts()) {
    return false;
  }
  const ConfigMode mode(*this);
  SelectLogicalDevice(powerLedLdn);
  Run(StepsOf(list), config);
  return true;
}

}  // namespace panelglow
