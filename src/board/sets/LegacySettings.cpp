#include "board/sets/LegacySettings.h"

#include <algorithm>
#include <string>
#include <utility>

#include "board/base/SelectedSystem.h"
#include "board/base/Setting.h"
#include "board/parts/NumberedText.h"
#include "board/sets/ReadSettings.h"
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

// The number that a value begins with, as in "-1 ; none"; the whole value when there is none. People are told of what
// stands behind it, unless that is a remark.
std::string LeadingNumber(const Setting& setting) {
  const std::string text = CDMUtil::Trim(setting.text);
  const std::size_t sign = text.find_first_of("+-") == 0 ? 1 : 0;
  const bool isHex = text.compare(sign, 2, "0x") == 0 || text.compare(sign, 2, "0X") == 0;
  const std::size_t digits = sign + (isHex ? 2 : 0);
  const std::size_t end =
      std::min(text.find_first_not_of(isHex ? "0123456789abcdefABCDEF" : "0123456789", digits), text.size());
  if (end == digits) {
    return text;
  }
  const std::string number = text.substr(0, end);
  const std::string rest = CDMUtil::Trim(text.substr(end));
  if (!rest.empty() && rest.front() != ';') {
    TellOf(setting, "\"" + text + "\" counts as " + number);
  }
  return number;
}

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
    const std::string token = LeadingNumber(setting);
    const int number = CDMUtil::ToInt(token);
    CheckNumber(token, kIntBits, static_cast<std::uint32_t>(number), setting);
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
    return setting.text.empty() ? std::uint16_t{0}
                                : static_cast<std::uint16_t>(NumberIn(LeadingNumber(setting), 16, setting));
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
  LegacySettings settings{.powerIoBase = keys.Word("PowerIOBaseAddr"),
                          .monitorIndexPort = keys.Word("SuperIOBaseAddr"),
                          .monitorDataPort = keys.Word("SuperIOBaseData"),
                          .stabilizationWait_ms = MillisecondsIn(keys.Number("FansTimeToStabilize", kStabilization_s),
                                                                 keys.Text("FansTimeToStabilize")),
                          .fans = ReadFans(keys),
                          .probe = {.rate_s = keys.Number("TempProbeRate", kProbeRate_s),
                                    .consecutiveHigh = keys.Number("TempConsecutiveHigh", 1),
                                    .consecutiveLow = keys.Number("TempConsecutiveLow", 1),
                                    .retriesOnInvalid = keys.Number("TempRetriesOnInvalid", 1)},
                          .zones = ReadZones(keys)};
  if (!settings.fans.empty() || !settings.zones.empty()) {
    for (const auto& [key, port] : {std::pair{"SuperIOBaseAddr", settings.monitorIndexPort},
                                    std::pair{"SuperIOBaseData", settings.monitorDataPort}}) {
      if (port == 0) {
        TellOf(keys.Text(key), "there is no port, and so nothing is read of the fans and temperatures");
      }
    }
  }
  for (std::size_t i = 0; i < kLegacyDevices; ++i) {
    settings.lines[i] = keys.Number(kDevices[i].key, kNoLine);
  }
  return settings;
}

}  // namespace panelglow
