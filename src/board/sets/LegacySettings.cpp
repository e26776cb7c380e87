#include "board/sets/LegacySettings.h"

#include <algorithm>
#include <limits>
#include <string>

#include "board/base/SelectedSystem.h"
#include "board/base/Setting.h"
#include "board/parts/NumberedText.h"
#include "harness/base/CDMUtil.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

struct DeviceRow {
  const char* title;
  const char* key;
};

constexpr std::array<DeviceRow, kLegacyDevices> kDevices{{
    // in the order of LegacyDevice
    {"Boot block jumper", "DetectBootBlockJumperGPI"},
    {"Boot block recovery jumper", "DetectBootBlockRecoveryJumperGPI"},
    {"Flash override jumper", "DetectFlashOverrideJumperGPI"},
    {"PCI riser", "DetectPCIRiserGPI"},
    {"Coil", "DetectCoilGPI"},
    {"Hood switch cable", "DetectHoodSwitchCableGPI"},
    {"Password jumper", "DetectPasswordJumperGPI"},
    {"USB front panel", "DetectUSBFrontPanelGPI"},
    {"1394 front panel", "Detect1394FrontPanelGPI"},
    {"Audio cable", "DetectAudioCableGPI"},
    {"Power supply unit", "DetectPowerSupplyUnitGPI"},
    {"NIC DASH cable", "DetectNICDashCableGPI"},
}};

constexpr int kStabilization_s = 5;
constexpr int kProbeRate_s = 30;

// The keys of one section, without a layer above or below.
class FlatKeys {
 public:
  FlatKeys() : system(GetSelectedSystem()) {}

  [[nodiscard]] Setting Text(const std::string& key) const {
    constexpr std::size_t kValueBuffer = 1024;
    std::string value(kValueBuffer, '\0');
    value.resize(platform::TheHost().profiles.GetValue(system.section, key, "", value, system.detectIniPath));
    return {value, system.detectIniPath + ", section [" + system.section + "], key \"" + key + "\""};
  }

  [[nodiscard]] int Number(const std::string& key, int defaultValue) const {
    const Setting setting = Text(key);
    if (setting.text.empty()) {
      return defaultValue;
    }
    const int number = CDMUtil::ToInt(setting.text);
    CheckNumber(setting.text, 32, static_cast<std::uint32_t>(number), setting);
    return number;
  }

  [[nodiscard]] int Percent(const std::string& key, int defaultValue) const {
    const int percent = Number(key, defaultValue);
    const int limited = std::clamp(percent, 0, 100);
    if (limited != percent) {
      TellOf(Text(key), std::to_string(percent) + " percent is no duty and counts as " + std::to_string(limited));
    }
    return limited;
  }

  [[nodiscard]] std::uint16_t Word(const std::string& key) const {
    const Setting setting = Text(key);
    return setting.text.empty() ? std::uint16_t{0} : static_cast<std::uint16_t>(NumberIn(setting.text, 16, setting));
  }

 private:
  SelectedSystem system;
};

FanLimits ReadLimits(const FlatKeys& keys, const std::string& prefix) {
  const FanLimits usual;
  return {keys.Number(prefix + "Min", usual.min), keys.Number(prefix + "Max", usual.max)};
}

std::vector<Fan> ReadFans(const FlatKeys& keys) {
  std::vector<Fan> fans;
  const int most = keys.Number("MaximumFans", 0);
  for (int n = 1; n <= most; ++n) {
    const std::string prefix = NumberedText("Fan%d", n);
    Fan fan;
    fan.name = keys.Text(prefix + "Name").text;
    if (fan.name.empty()) {
      break;
    }
    fan.index = n;
    fan.present = true;
    fan.tachIndex = keys.Number(prefix + "TachIndex", fan.tachIndex);
    fan.nominal = ReadLimits(keys, prefix + "Nominal");
    fan.pwmIndex = n;
    fan.pwmDuty = keys.Percent(prefix + "PWM", fan.pwmDuty);
    fan.pwm = ReadLimits(keys, prefix + "PWM");
    fan.full = ReadLimits(keys, prefix + "Full");
    fans.push_back(std::move(fan));
  }
  return fans;
}

std::vector<TempZone> ReadZones(const FlatKeys& keys) {
  std::vector<TempZone> zones;
  const int most = keys.Number("MaxTempZones", 0);
  for (int n = 1; n <= most; ++n) {
    const std::string prefix = NumberedText("TSensor%d", n);
    TempZone zone;
    zone.name = keys.Text(prefix + "Name").text;
    if (zone.name.empty()) {
      break;
    }
    zone.number = n;
    zone.skipped = keys.Text(prefix + "Skip").text == "Yes";
    zone.index = keys.Number(prefix + "Index", zone.index);
    zone.thresholdAdj = keys.Number(prefix + "ThresholdAdj", zone.thresholdAdj);
    zone.thresholdHigh = keys.Number(prefix + "ThresholdHigh", zone.thresholdHigh);
    zone.thresholdFix = keys.Number(prefix + "ThresholdFix", zone.thresholdFix);
    zone.thresholdLow = keys.Number(prefix + "ThresholdLow", zone.thresholdLow);
    zones.push_back(std::move(zone));
  }
  return zones;
}

}  // namespace

const char* TitleOf(LegacyDevice device) { return kDevices[static_cast<std::size_t>(device)].title; }

LegacySettings LegacySettings::Load() {
  const FlatKeys keys;
  const std::int64_t wait_s = keys.Number("FansTimeToStabilize", kStabilization_s);
  constexpr std::int64_t kLongest = std::numeric_limits<std::uint32_t>::max();
  LegacySettings settings{
      .powerIoBase = keys.Word("PowerIOBaseAddr"),
      .monitorIndexPort = keys.Word("SuperIOBaseAddr"),
      .monitorDataPort = keys.Word("SuperIOBaseData"),
      .stabilizationWait_ms = static_cast<std::uint32_t>(std::clamp<std::int64_t>(wait_s * 1000, 0, kLongest)),
      .fans = ReadFans(keys),
      .probe = {.rate_s = keys.Number("TempProbeRate", kProbeRate_s),
                .consecutiveHigh = keys.Number("TempConsecutiveHigh", 1),
                .consecutiveLow = keys.Number("TempConsecutiveLow", 1),
                .retriesOnInvalid = keys.Number("TempRetriesOnInvalid", 1)},
      .zones = ReadZones(keys)};
  for (std::size_t i = 0; i < kLegacyDevices; ++i) {
    settings.lines[i] = keys.Number(kDevices[i].key, kNoLine);
  }
  return settings;
}

}  // namespace panelglow
