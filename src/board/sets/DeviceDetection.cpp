#include "board/sets/DeviceDetection.h"

#include "board/base/IniReader.h"
#include "board/sets/ReadSettings.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/CDMout.h"

namespace panelglow {

namespace {

constexpr const char* kAsserted = "true";
constexpr const char* kNotAsserted = "false";
constexpr const char* kFailed = "ERROR: device detection failed";
constexpr const char* kUnknown = "unknown";

// How a device is looked for.
enum class Way {
  kLine,      // a line's level
  kSignal,    // what a line does: low, high, or a signal
  kDash,      // whether a network controller's pin moves the line
  kRegister,  // the value of a register, where the files name one; else the line
  kStated,    // the files say it
};

struct KindRow {
  const char* title;
  const char* switchKey;  // "no" switches the kind off
  const char* prefix;     // of a device's keys
  bool isNumbered;        // "<prefix>.<n>", from 1 to the first without a name
  const char* nameKey;    // behind the prefix
  const char* name;       // of a device that the files give none
  Way way;
  const char* offsetLabel;  // the kind takes offset and bit in place of a line, and what its log calls it; or null
};

constexpr std::array<KindRow, kDeviceKinds> kKinds{{
    // in the order of DeviceKind
    {"Jumpers", "detect.jumpers", "detect.jumper", true, ".name", "", Way::kLine, "Jumper"},
    {"Front panel", "detect.frontpanel", "detect.frontpanel", true, ".name", "", Way::kLine, nullptr},
    {"Security devices", "detect.security", "detect.security", true, ".name", "", Way::kLine, "Security Devices"},
    {"Power supply", "detect.powersupply", "detect.powersupply", false, ".name", "PowerSupplyID", Way::kLine,
     nullptr},
    {"Heatsink", "detect.heatsink", "detect.heatsink", false, ".cpufanname", "", Way::kSignal, nullptr},
    {"DASH cable", "detect.dashcable", "detect.dashcable", false, ".name", "", Way::kDash, nullptr},
    {"Riser", "detect.riser", "detect.riser", false, ".name", "", Way::kRegister, nullptr},
    {"Cables", "detect.cable", "detect.cable", true, ".name", "", Way::kLine, nullptr},
    {"Powered devices", "detect.powereddevice", "detect.powereddevice", true, ".name", "", Way::kLine, nullptr},
    {"Internal speaker", "detect.internalspeaker", "detect.internalspeaker", false, "", "internal speaker",
     Way::kStated, nullptr},
    {"Touch screen", "detect.touchscreen", "detect.touchscreen", false, "", "Touch Screen", Way::kStated, nullptr},
}};

const KindRow& RowOfKind(DeviceKind kind) { return kKinds[static_cast<std::size_t>(kind)]; }

const char* WordOf(int state, bool reversed) {
  if (state == Chip::kNoSuchLine) {
    return kFailed;
  }
  return (state == Chip::kAsserted) != reversed ? kAsserted : kNotAsserted;
}

const char* HeatsinkWord(Chip& chip, int line, bool reversed) {
  constexpr int kNoSignal = -1;  // below it: transitions, negative
  int activity = kNoSignal;
  if (!chip.ReadLineActivity(line, activity) || activity == kNoSignal) {
    return kFailed;
  }
  if (activity < kNoSignal) {
    return "liquid";
  }
  return (activity != 0) != reversed ? "high" : "low";
}

// Whether a register tells of the device: people are told when the files give only one of the two keys for that.
bool NamesRegister(const std::string& prefix) {
  const Setting reg = IniReader::Instance().ReadIniSetting(prefix + ".reg", "");
  const Setting value = IniReader::Instance().ReadIniSetting(prefix + ".reg.value", "");
  if (reg.text.empty() != value.text.empty()) {
    TellOf(reg.text.empty() ? value : reg,
           "it counts only with \"" + prefix + (reg.text.empty() ? ".reg\"" : ".reg.value\""));
  }
  return !reg.text.empty();
}

// What is not there, and what there is nothing to compare with, tells nothing.
const char* RegisterWord(Chip& chip, const std::string& prefix, bool reversed) {
  if (!IsThere(chip) || ReadIniValue(prefix + ".reg.value", "").empty()) {
    return kFailed;
  }
  const int wanted = ReadIniInt(prefix + ".reg.value", 0);
  return WordOf(LineState(chip.ReadRegister(ReadIniInt(prefix + ".reg", 0)) == wanted), reversed);
}

}  // namespace

const char* TitleOf(DeviceKind kind) { return RowOfKind(kind).title; }

// The keys that name a line, or offset and bit of a register in place of it. False: one of these is missing.
bool DeviceDetection::ReadPlace(const std::string& prefix, const char* offsetLabel, DEVICE_INFO& device) {
  const LineSetting line = ReadLineNumber(prefix + ".gpio");
  device.gpio = static_cast<std::uint32_t>(line.line);
  device.specialLine = line.isSpecial;
  device.reversedLogic = ReadYesNo(prefix + ".reversedlogic", false);
  if (offsetLabel == nullptr) {
    return true;
  }
  const Setting offset = IniReader::Instance().ReadIniSetting(prefix + ".gpio.offset", "");
  device.bit = CDMUtil::Trim(ReadIniValue(prefix + ".gpio.bit", ""));
  device.clearBit = CDMUtil::Trim(ReadIniValue(prefix + ".gpio.clearbit", ""));
  if (offset.text.empty() != device.bit.empty()) {
    CDMout::LogMessage(LogOptions::Debug, kNote, std::string(offsetLabel) + ": Missing GPIO offset/bit information");
    return false;
  }
  device.useOffset = !device.bit.empty();
  device.offset = device.useOffset ? WideNumberIn(CDMUtil::Trim(offset.text), offset) : 0;
  return true;
}

void DeviceDetection::Look(DeviceKind kind, const std::string& prefix, DEVICE_INFO& device) {
  const KindRow& row = RowOfKind(kind);
  if (row.way == Way::kStated) {
    device.status = kUnknown;
    return;
  }
  if (!ReadPlace(prefix, row.offsetLabel, device)) {
    return;
  }
  Chip& chip = chipOf(device.chip);
  const int line = static_cast<int>(device.gpio);
  if (row.way == Way::kSignal) {
    device.status = HeatsinkWord(chip, line, device.reversedLogic);
  } else if (row.way == Way::kDash) {
    device.status = WordOf(chip.ReadDashCable(line, ReadIniValue(prefix + ".pciid", "")), device.reversedLogic);
  } else if (row.way == Way::kRegister && NamesRegister(prefix)) {
    device.status = RegisterWord(chip, prefix, device.reversedLogic);
  } else if (device.useOffset) {
    device.status = WordOf(chip.ReadLineByNames(device.offset, device.bit, device.clearBit), device.reversedLogic);
  } else {
    device.status = WordOf(chip.ReadLine(line), device.reversedLogic);
  }
}

// Whether the files have the device at all: they name it or, where it has a name of its own, its chip, or state it.
bool DeviceDetection::IsNamed(DeviceKind kind, const std::string& prefix, DEVICE_INFO& device) {
  const KindRow& row = RowOfKind(kind);
  if (row.way == Way::kStated) {
    device.name = row.name;
    return ReadYesNo(prefix + ".is_present", false);
  }
  const std::string given = ReadIniValue(prefix + row.nameKey, "");
  device.chip = given.empty() && *row.name == '\0' ? "" : ReadChipName(prefix + ".chip", "", chipOf);
  device.name = given.empty() && !device.chip.empty() ? row.name : given;
  return !device.name.empty();
}

bool DeviceDetection::Detect(DeviceKind kind) {
  const KindRow& row = RowOfKind(kind);
  std::vector<DEVICE_INFO>& list = lists[static_cast<std::size_t>(kind)];
  list.clear();
  if (SaysNo(row.switchKey)) {
    return true;
  }
  for (int n = 1;; ++n) {
    const std::string prefix = row.prefix + (row.isNumbered ? "." + CDMUtil::ToString(n) : std::string());
    DEVICE_INFO device;
    device.present = IsNamed(kind, prefix, device);
    if (!device.present) {
      return true;
    }
    if (!row.isNumbered || !SaysNo(prefix)) {
      Look(kind, prefix, device);
      list.push_back(std::move(device));
    }
    if (!row.isNumbered) {
      return true;
    }
  }
}

}  // namespace panelglow
