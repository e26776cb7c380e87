#include "board/chips/ec/SmscKbc1126Chip.h"

#include <algorithm>
#include <array>
#include <numeric>

#include "board/base/IniReader.h"
#include "board/parts/Bits.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint8_t kReadCommand = 0x80;
constexpr std::uint8_t kWriteCommand = 0x81;

constexpr std::uint8_t kTach1 = 0x2E;
constexpr std::uint8_t kTach2 = 0x3A;
constexpr std::uint8_t kDuty1 = 0x2F;
constexpr std::uint8_t kDuty2 = 0x3A;
constexpr std::uint8_t kZoneSelect = 0x22;
constexpr std::uint8_t kZoneTemperature = 0x26;
constexpr std::uint8_t kPowerLed = 0x3D;
constexpr std::uint8_t kPowerLedOn = 0xF3;
constexpr std::uint8_t kPowerLedOff = 0xF0;

constexpr std::uint32_t kNoTach = 255;
constexpr int kNoTemperature = 255;
constexpr int kTachClock = 0x780000;
constexpr int kRawTachClock = 245670;  // of fan 2 read raw
constexpr int kFullScale = 255;

constexpr std::uint32_t kBetweenSamples_ms = 1000;

}  // namespace

SmscKbc1126Chip::SmscKbc1126Chip()
    : EcChip("smsc_kbc1126"), runningAverage(ReadIniValue("chip.smsc_kbc1126.runningaverage", "false") == "true") {}

std::uint8_t SmscKbc1126Chip::ReadEc(std::uint8_t address) {
  WaitObfSet();
  Send(kReadCommand, {address});
  WaitIbfClear();
  WaitObfSet();
  return TakeOutput();
}

void SmscKbc1126Chip::WriteEc(std::uint8_t address, std::uint8_t value) {
  WaitObfSet();
  Send(kWriteCommand, {address, value});
}

std::uint32_t SmscKbc1126Chip::ReadFanTach(int fan, int /*arg*/) {
  if (fan != 1 && fan != 2) {
    return kNoTach;
  }
  const std::uint8_t address = fan == 1 ? kTach1 : kTach2;
  return runningAverage ? AverageTach(fan, address) : ReadEc(address);
}

// The mean of ten samples without the lowest and the highest.
std::uint32_t SmscKbc1126Chip::AverageTach(int fan, std::uint8_t address) {
  std::array<std::uint32_t, 10> samples{};
  for (std::uint32_t& sample : samples) {
    sample = ReadEc(address);
    CDMout::LogMessage(LogOptions::Status, kFreeText,
                       "Fan Tach for fan index: " + CDMUtil::ToString(fan) + " = 0x" +
                           CDMUtil::ToHexString(static_cast<int>(sample)) + " \n");
    platform::TheHost().clock.Sleep(kBetweenSamples_ms);
  }
  std::sort(samples.begin(), samples.end());
  return std::accumulate(samples.begin() + 1, samples.end() - 1, std::uint32_t{0}) /
         static_cast<std::uint32_t>(samples.size() - 2);
}

int SmscKbc1126Chip::TachToRpm(std::uint32_t raw, int /*multiplier*/) {
  return raw == 0 ? 0 : kTachClock / (static_cast<int>(raw) * 32);
}

bool SmscKbc1126Chip::ReadFanRpmRaw(int fan, int& rpm, int multiplier) {
  const std::uint32_t raw = ReadFanTach(fan, 1);
  if (fan == 2) {
    rpm = raw == 0 ? 0 : kRawTachClock / static_cast<int>(raw);
  } else {
    rpm = TachToRpm(raw, multiplier);
  }
  return true;
}

bool SmscKbc1126Chip::SetFanPwm(int fan, int value) {
  if (fan != 1 && fan != 2) {
    return false;
  }
  WriteEc(fan == 1 ? kDuty1 : kDuty2, LowByte(static_cast<std::uint32_t>(value)));
  return true;
}

bool SmscKbc1126Chip::SetFanFullSpeed(int fan) { return SetFanPwm(fan, 1); }

bool SmscKbc1126Chip::SetFanPwmPercent(int fan, int percent) {
  return SetFanPwm(fan, static_cast<int>((100 - std::int64_t{percent}) * kFullScale / 100));
}

bool SmscKbc1126Chip::SetManualFanMode(bool on) {
  if (!on && manualFanMode) {
    SetFanPwm(1, kFullScale);
    SetFanPwm(2, 0);
  }
  manualFanMode = on;
  return true;
}

// Some zones have no sensor and answer with a value of their own.
bool SmscKbc1126Chip::ReadTemperature(int zone, int& value) {
  WriteEc(kZoneSelect, LowByte(static_cast<std::uint32_t>(zone)));
  value = ReadEc(kZoneTemperature);
  if (value == 0 || (zone == 2 && value == 0x55) || (zone == 5 && value == 0x14)) {
    value = kNoTemperature;
  }
  return true;
}

bool SmscKbc1126Chip::AssertPowerLedGreen() {
  WriteEc(kPowerLed, kPowerLedOn);
  return true;
}

bool SmscKbc1126Chip::DeassertPowerLed() {
  WriteEc(kPowerLed, kPowerLedOff);
  return true;
}

}  // namespace panelglow
