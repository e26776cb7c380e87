#include "board/chips/sensor/AdtChip.h"

#include <utility>

#include "board/base/IniReader.h"
#include "board/parts/RowOf.h"
#include "board/parts/RpmOf.h"
#include "harness/base/CDMout.h"

namespace panelglow {

namespace {

constexpr RegisterId kStart{0, 0x40};
constexpr RegisterId kFan1Mode{0, 0x5C};
constexpr RegisterId kFan2Mode{0, 0x5D};
constexpr RegisterId kFan3Mode{0, 0x5E};
constexpr std::uint8_t kManual = 0xE0;
constexpr RegisterId kRamp1{0, 0x62};
constexpr RegisterId kRamp2{0, 0x63};

constexpr std::uint8_t kNoAnswer = 0xFF;  // what a bus reads that nobody drives

}  // namespace

AdtChip::AdtChip() : AdtChip("adt") {}

AdtChip::AdtChip(std::string chipName)
    : RegisterChip(std::move(chipName)),
      host(devio, 0),
      monitor(*this, &AdtChip::ReadMonitor, &AdtChip::WriteMonitor) {
  ReadKeys("chip.adt.", 0xFC00, 0x2D);
  fans = {.tachs = RegisterPairs(0, 0x28, 4),
          .duties = RegisterRun(0, 0x30, 3),
          .saved = RegistersAt(0, {0x40, 0x5C, 0x5D, 0x5E, 0x30, 0x31, 0x32, 0x62, 0x63}),
          .manual = {Change(kStart, 0xFC, 0), Put(kFan1Mode, kManual), Put(kFan2Mode, kManual),
                     Put(kFan3Mode, kManual), SetBits(kRamp1, 0xE7), Put(kRamp2, 0x77)}};
  // Whole degrees: their fractions, in 0x1A to 0x1C, count for nothing here.
  zones = {.zones = RegistersAt(0, {0x25, 0x26, 0x27})};
}

void AdtChip::ReadKeys(const std::string& prefix, std::uint16_t hostBase, std::uint8_t deviceAddress) {
  host = SmbusHost(devio, ReadIniWord(prefix + "smbusbar", hostBase));
  address = ReadIniByte(prefix + "smbussar", deviceAddress);
}

std::uint8_t AdtChip::ReadMonitor(std::uint8_t reg) {
  const std::optional<std::uint8_t> value = host.ReadByte(address, reg);
  hasFailed = hasFailed || !value;
  return value.value_or(kNoAnswer);
}

void AdtChip::WriteMonitor(std::uint8_t reg, std::uint8_t value) {
  // What is written behind a failure may be made of a byte that was not read.
  hasFailed = hasFailed || !host.WriteByte(address, reg, value);
}

// ---- fans

std::uint32_t AdtChip::ReadFanTach(int fan, int arg) {
  hasFailed = false;
  const std::uint32_t raw = RegisterChip::ReadFanTach(fan, arg);
  return hasFailed ? kTachStopped : raw;
}

bool AdtChip::SaveFanState() {
  if (savedFans.Holds()) {
    return true;
  }
  hasFailed = false;
  RegisterChip::SaveFanState();
  if (hasFailed) {
    savedFans.Forget();
  }
  return !hasFailed;
}

bool AdtChip::RestoreFanState() {
  hasFailed = false;
  const bool wasManual = manualFanMode;
  RegisterChip::RestoreFanState();
  isHalfBack = wasManual && hasFailed;
  manualFanMode = isHalfBack;  // to be put back again
  return !hasFailed;
}

bool AdtChip::SetManualFanMode(bool on) {
  if (on && !SaveFanState()) {
    return false;
  }
  hasFailed = false;
  if (on && std::exchange(isHalfBack, false)) {
    manualFanMode = false;  // to be taken over again
  }
  RegisterChip::SetManualFanMode(on);
  if (on && hasFailed) {
    RestoreFanState();
    return false;
  }
  return !hasFailed;
}

bool AdtChip::SetFanPwm(int fan, int value) {
  if (RowOf(fans.duties, fan) == nullptr) {
    CDMout::LogMessage(LogOptions::Debug, kFreeText, "Invalid PWM index specified");
  }
  hasFailed = false;
  return RegisterChip::SetFanPwm(fan, value) && !hasFailed;
}

// ---- temperatures

bool AdtChip::ReadTemperature(int zone, int& value) {
  hasFailed = false;
  return RegisterChip::ReadTemperature(zone, value) && !hasFailed;
}

}  // namespace panelglow
