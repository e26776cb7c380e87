#include "board/chips/RegisterChip.h"

#include <utility>
#include <vector>

#include "board/parts/Bits.h"
#include "board/parts/ConfigMode.h"
#include "board/parts/NumberedText.h"
#include "board/parts/RowOf.h"
#include "board/parts/RpmOf.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

void Print(const std::string& text, int number) {
  if (!text.empty()) {
    platform::TheHost().console.Write(NumberedText(text, number));
  }
}

const std::vector<RegisterId>& OrderOf(const std::vector<RegisterId>& restored,
                                       const std::vector<RegisterId>& saved) {
  return restored.empty() ? saved : restored;
}

}  // namespace

RegisterChip::RegisterChip(std::string chipName) : Chip(std::move(chipName)) {}

// ---- fans

bool RegisterChip::SaveFanState() {
  if (fans.saved.empty()) {
    return Chip::SaveFanState();
  }
  if (!savedFans.Holds()) {
    const ConfigMode mode(Monitor());
    savedFans.SaveOnce(Monitor(), fans.saved);
  }
  return true;
}

bool RegisterChip::RestoreFanState() {
  if (fans.saved.empty()) {
    return Chip::RestoreFanState();
  }
  if (savedFans.Holds()) {
    {
      const ConfigMode mode(Monitor());
      savedFans.Restore(Monitor(), OrderOf(fans.restored, fans.saved));
    }
    manualFanMode = false;
    if (fans.restoreWait_ms != 0) {
      platform::TheHost().clock.Sleep(fans.restoreWait_ms);
    }
  }
  return true;
}

bool RegisterChip::SetManualFanMode(bool on) {
  if (fans.saved.empty()) {
    return Chip::SetManualFanMode(on);
  }
  if (on && !manualFanMode) {
    SaveFanState();
    manualFanMode = true;  // first: steps that are interrupted are put back, too
    const ConfigMode mode(Monitor());
    Run(fans.manual, Monitor(), savedFans);
  } else if (!on && manualFanMode) {
    RestoreFanState();
  }
  return true;
}

std::uint32_t RegisterChip::ReadPair(const RegisterPair& pair, PairOrder order) {
  const ConfigMode mode(Monitor());
  const std::uint8_t first = Monitor().Read(pair.first);
  const std::uint8_t second = Monitor().Read(pair.second);
  return order == PairOrder::kHighFirst ? WordOf(first, second) : WordOf(second, first);
}

std::uint32_t RegisterChip::ReadFanTach(int fan, int arg) {
  if (fans.tachs.empty()) {
    return Chip::ReadFanTach(fan, arg);
  }
  const RegisterPair* pair = RowOf(fans.tachs, fan, fans.firstFan);
  if (pair == nullptr) {
    Print(fans.badTachText, fan);
    return kTachStopped;
  }
  const std::uint32_t raw = ReadPair(*pair, fans.tachOrder);
  return raw >= fans.tachOverflow ? kTachStopped : raw;
}

std::uint8_t RegisterChip::DutyOf(int value) const { return LowByte(static_cast<std::uint32_t>(value)); }

bool RegisterChip::WriteDuty(int fan, int value) {
  const RegisterId* duty = RowOf(fans.duties, fan, fans.firstFan);
  if (duty == nullptr) {
    Print(fans.badDutyText, fan);
    return false;
  }
  const ConfigMode mode(Monitor());
  Monitor().Write(*duty, DutyOf(value));
  return true;
}

bool RegisterChip::SetFanFullSpeed(int fan) {
  if (!fans.fullSpeed) {
    return Chip::SetFanFullSpeed(fan);
  }
  SetManualFanMode(true);
  return WriteDuty(fan, *fans.fullSpeed);
}

bool RegisterChip::SetFanPwm(int fan, int value) {
  return fans.duties.empty() ? Chip::SetFanPwm(fan, value) : WriteDuty(fan, value);
}

// ---- temperatures

bool RegisterChip::ReadTemperature(int zone, int& value) {
  const RegisterId* reg = RowOf(zones.zones, zone);
  if (reg == nullptr) {
    Print(zones.badZoneText, zone);
    value = zones.badZoneValue.value_or(value);
    return false;
  }
  const ConfigMode mode(Monitor());
  value = Monitor().Read(*reg);
  return true;
}

bool RegisterChip::ReadLowLimitTemperature(int zone, int& value) {
  const RegisterPair* pair = RowOf(zones.lowLimits, zone);
  if (pair == nullptr) {
    Print(zones.badLimitText, zone);
    return false;
  }
  value = static_cast<int>(ReadPair(*pair, zones.limitOrder));
  return true;
}

// ---- power LED

bool RegisterChip::IsPowerLedRedSupported(bool& supported) {
  if (!led.isRedSupported) {
    return Chip::IsPowerLedRedSupported(supported);
  }
  supported = true;
  return true;
}

// Register by register where the save changes some: what has been changed by then can be put back.
void RegisterChip::TakeLed() {
  const ConfigMode mode(LedRegisters());
  if (led.prepared.empty()) {
    savedLed.SaveOnce(LedRegisters(), led.saved);
    return;
  }
  for (const RegisterId id : led.saved) {
    savedLed.Keep(LedRegisters(), id);
    for (const Step& step : led.prepared) {
      if (step.id == id) {
        Run({&step, 1}, LedRegisters(), savedLed);
      }
    }
  }
}

bool RegisterChip::SavePowerLedState() {
  if (led.saved.empty()) {
    return Chip::SavePowerLedState();
  }
  if (savedLed.Count() < led.saved.size()) {
    TakeLed();
  }
  return true;
}

bool RegisterChip::RestorePowerLedState() {
  if (led.saved.empty()) {
    return Chip::RestorePowerLedState();
  }
  if (savedLed.Holds()) {
    const ConfigMode mode(LedRegisters());
    savedLed.Restore(LedRegisters(), OrderOf(led.restored, led.saved));
  }
  savedLed.Forget();
  return true;
}

bool RegisterChip::RunLed(const std::optional<Steps>& steps) {
  if (!steps || steps->empty()) {
    return steps.has_value();
  }
  const ConfigMode mode(LedRegisters());
  Run(*steps, LedRegisters(), savedLed);
  return true;
}

}  // namespace panelglow
