#include "board/sets/FanSet.h"

#include <algorithm>

#include "board/base/IniReader.h"
#include "board/parts/ConfigMode.h"
#include "board/sets/EachOf.h"
#include "board/sets/ReadSettings.h"
#include "harness/base/CDMUtil.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"

namespace panelglow {

namespace {

constexpr std::uint32_t kControlSettle_ms = 750;
constexpr int kStabilization_s = 5;

constexpr const char* kThere = "true";
constexpr const char* kNotThere = "false";
constexpr const char* kFailed = "ERROR: device detection failed";

bool IsUnderTest(const Fan& fan) { return fan.present && fan.tested; }

// What a chip's fans are held by is their duty; one that has none is reached by its tachometer's chip.
const std::string& DrivingChip(const Fan& fan) { return fan.pwmChip.empty() ? fan.tachChip : fan.pwmChip; }

// Whether software can hold it: not when the files name a chip for its speed alone.
bool HasDuty(const Fan& fan) { return !fan.pwmChip.empty() || fan.tachChip.empty(); }

int ControlNumber(const Fan& fan) { return fan.cfgRegIndex == 0 ? fan.pwmIndex : fan.cfgRegIndex; }

FanLimits ReadLimits(const std::string& prefix) {
  const FanLimits usual;
  return {ReadIniInt(prefix + ".min", usual.min), ReadIniInt(prefix + ".max", usual.max)};
}

// Chips whose fans software holds; for the life of a ConfigMode.
class HeldFans {
 public:
  explicit HeldFans(std::vector<Chip*> list) : chips(std::move(list)) {}
  void EnterConfigMode() { Hold(true, "taken over"); }
  void ExitConfigMode() { Hold(false, "given back"); }

 private:
  // One that cannot does not keep the next ones from it.
  void Hold(bool on, const char* what) {
    for (Chip* chip : chips) {
      try {
        chip->SetManualFanMode(on);
      } catch (const mblib_exception& broken) {
        Notices::Tell("The fans of the chip \"" + chip->GetName() + "\" were not " + what + ": " + broken.what() +
                      ".");
      }
    }
  }

  std::vector<Chip*> chips;
};

void AddOnce(std::vector<Chip*>& list, Chip& chip) {
  if (std::find(list.begin(), list.end(), &chip) == list.end()) {
    list.push_back(&chip);
  }
}

}  // namespace

// ---- from the files

FanSet::BoardTest FanSet::ReadBoardTest(const char* key) {
  const Setting setting = IniReader::Instance().ReadIniSetting(key, "");
  if (!setting.text.empty() && setting.text != "yes" && setting.text != "no") {
    TellOf(setting, "\"" + setting.text + "\" is neither yes nor no; each fan decides");
  }
  return {.enabled = setting.text != "no", .forced = setting.text == "yes"};
}

Fan FanSet::ReadFan(int index) const {
  const std::string number = CDMUtil::ToString(index);
  const std::string detect = "detect.fan." + number + ".";
  const std::string test = "test.fan." + number;
  Fan fan;
  fan.index = index;
  fan.present = true;
  fan.tachChip = ReadChipName(detect + "tach.chip", "", chipOf);
  fan.tachIndex = ReadIniInt(detect + "tach.index", fan.tachIndex);
  fan.gpioChip = ReadChipName(detect + "gpio.chip", "", chipOf);
  fan.gpio = ReadIniInt(detect + "gpio", fan.gpio);
  fan.reversedLogic = ReadYesNo(detect + "gpio.reversedlogic", fan.reversedLogic);
  fan.tachMultiplier = ReadIniInt(detect + "tach.multiplier", fan.tachMultiplier);
  fan.pwmChip = ReadChipName(detect + "pwm.chip", "", chipOf);
  fan.pwmIndex = ReadIniInt(detect + "pwm.index", fan.pwmIndex);
  fan.pwmApply = ReadYesNo(detect + "pwm.apply", fan.pwmApply);
  fan.pwmDutyDetect = ReadPercent(detect + "pwm.duty", fan.pwmDutyDetect);
  fan.cfgRegIndex = ReadIniInt(detect + "cfg_reg.index", fan.cfgRegIndex);
  fan.syntheticMode = ReadYesNo(detect + "cfg_reg.syntheticmode", fan.syntheticMode);
  fan.tested = !SaysNo(test);
  fan.nominalTest = ReadYesNo(test + ".nominal", nominalTest.enabled);
  fan.nominal = ReadLimits(test + ".nominal");
  fan.pwmTest = ReadYesNo(test + ".pwm", pwmTest.enabled);
  fan.pwmDuty = ReadPercent(test + ".pwm.duty", fan.pwmDuty);
  fan.pwm = ReadLimits(test + ".pwm");
  fan.fullTest = ReadYesNo(test + ".full", fullTest.enabled);
  fan.full = ReadLimits(test + ".full");
  return fan;
}

bool FanSet::Load() {
  fans.clear();
  groups.clear();
  nominalTest = ReadBoardTest("test.fans.nominal");
  fullTest = ReadBoardTest("test.fans.full");
  pwmTest = ReadBoardTest("test.fans.pwm");
  constexpr const char* kWait = "test.fans.stabilizationwait";
  stabilizationWait_ms =
      MillisecondsIn(ReadIniInt(kWait, kStabilization_s), IniReader::Instance().ReadIniSetting(kWait, ""));
  if (SaysNo("detect.fans")) {
    return true;
  }
  for (int n = 1;; ++n) {
    const std::string key = "detect.fan." + CDMUtil::ToString(n);
    const std::string name = ReadIniValue(key + ".name", "");
    if (name.empty()) {
      return true;
    }
    if (!SaysNo(key)) {
      fans.push_back(ReadFan(n));
      fans.back().name = name;
    }
  }
}

void FanSet::Take(std::vector<Fan> list, std::uint32_t wait_ms) {
  fans = std::move(list);
  groups.clear();
  stabilizationWait_ms = wait_ms;
}

bool FanSet::LoadGroups() {
  std::vector<FanGroup> found;
  const bool hasGroups = !SaysNo("detect.fans.group");
  for (int n = 1; hasGroups; ++n) {
    const std::string prefix = "test.fans.group." + CDMUtil::ToString(n);
    FanGroup group{ReadIniValue(prefix + ".name", ""), {}};
    if (group.name.empty()) {
      break;
    }
    const Setting list = IniReader::Instance().ReadIniSetting(prefix + ".fans", "");
    for (const int index : NumbersIn(list)) {
      if (Find(index) != nullptr) {
        group.fans.push_back(index);
      } else {
        TellOf(list, "there is no fan " + CDMUtil::ToString(index));
      }
    }
    found.push_back(std::move(group));
  }
  groups = std::move(found);
  return true;
}

const Fan* FanSet::Find(int index) const {
  const auto found = std::find_if(fans.begin(), fans.end(), [&](const Fan& fan) { return fan.index == index; });
  return found == fans.end() ? nullptr : &*found;
}

// ---- which are plugged in

bool FanSet::Detect() {
  std::vector<Fan*> byTach;
  for (Fan& fan : fans) {
    if (fan.gpio == LineSetting::kNone) {
      byTach.push_back(&fan);
      continue;
    }
    const int state = chipOf(fan.gpioChip).ReadLine(fan.gpio);
    const bool isThere = (state == Chip::kAsserted) != fan.reversedLogic;
    fan.detectionStatus = state == Chip::kNoSuchLine ? kFailed : isThere ? kThere : kNotThere;
  }
  DetectByTach(byTach);
  return true;
}

void FanSet::DetectByTach(const std::vector<Fan*>& list) {
  const auto attempt = [](Fan& fan, const auto& action) {
    try {
      action();
    } catch (const mblib_exception& broken) {
      Notices::Tell("The fan \"" + fan.name + "\" cannot be looked for: " + broken.what() + ".");
      fan.detectionStatus = kFailed;
    }
  };
  std::vector<Chip*> held;
  for (const Fan* fan : list) {
    if (fan->pwmApply && !chipOf(fan->pwmChip).IsFanModeManual()) {  // who has taken it over already gives it back
      AddOnce(held, chipOf(fan->pwmChip));
    }
  }
  HeldFans fansInHand(held);
  const ConfigMode hold(fansInHand);
  bool isDriven = false;
  for (Fan* fan : list) {
    fan->detectionStatus.clear();
    if (fan->pwmApply) {
      isDriven = true;
      attempt(*fan, [&] { chipOf(fan->pwmChip).SetFanPwmPercent(fan->pwmIndex, fan->pwmDutyDetect); });
    }
  }
  if (isDriven) {
    Wait();
  }
  for (Fan* fan : list) {
    if (fan->detectionStatus.empty()) {
      attempt(*fan, [&] {
        int rpm = 0;
        const bool turns = chipOf(fan->tachChip).ReadFanRpm(fan->tachIndex, rpm, fan->tachMultiplier) && rpm > 0;
        fan->detectionStatus = turns ? kThere : kNotThere;
      });
    }
  }
}

// ---- choice of tests

bool FanSet::SetActiveReadingSet(std::uint32_t index) {
  if (index >= kFanReadings) {
    return false;
  }
  readingSet = index;
  return true;
}

void FanSet::SetTests(bool full, bool pwm, bool nominal) {
  for (Fan& fan : fans) {
    fan.fullTest = fullTest.forced ? full : fan.fullTest;
    fan.pwmTest = pwmTest.forced ? pwm : fan.pwmTest;
    fan.nominalTest = nominalTest.forced ? nominal : fan.nominalTest;
  }
}

// ---- taking over and giving back

void FanSet::TakeControl() {
  EachOf(fans, [this](const Fan& fan) {
    if (IsUnderTest(fan) && fan.syntheticMode) {
      Chip& chip = chipOf(DrivingChip(fan));
      chip.SaveFanControl(ControlNumber(fan));
      chip.TakeFanControl(ControlNumber(fan));
      platform::TheHost().clock.Sleep(kControlSettle_ms);
    }
    return true;
  });
}

void FanSet::ReleaseControl() {
  EachOf(fans, [this](const Fan& fan) {
    if (IsUnderTest(fan) && fan.syntheticMode) {
      chipOf(DrivingChip(fan)).RestoreFanControl(ControlNumber(fan));
      platform::TheHost().clock.Sleep(kControlSettle_ms);
    }
    return true;
  });
}

std::vector<Chip*> FanSet::ChipsUnderTest(bool (*serves)(const Fan& fan)) {
  std::vector<Chip*> chips;
  for (const Fan& fan : fans) {
    if (IsUnderTest(fan) && serves(fan)) {
      AddOnce(chips, chipOf(DrivingChip(fan)));
    }
  }
  return chips;
}

bool FanSet::SetManualMode(bool on) {
  return EachOf(ChipsUnderTest(HasDuty), [on](Chip* chip) { return chip->SetManualFanMode(on); });
}

bool FanSet::SaveStates() {
  return EachOf(ChipsUnderTest(IsUnderTest), [](Chip* chip) { return chip->SaveFanState(); });
}

bool FanSet::RestoreStates() {
  return EachOf(ChipsUnderTest(IsUnderTest), [](Chip* chip) { return chip->RestoreFanState(); });
}

// ---- speeds

bool FanSet::ReadInto(Fan& fan) {
  int rpm = 0;
  fan.readings[readingSet] = kNotRead;  // ... it stays, when the chip throws
  const bool done = chipOf(fan.tachChip).ReadFanRpm(fan.tachIndex, rpm, fan.tachMultiplier);
  fan.readings[readingSet] = rpm;
  fan.readingTime = TimeStamp();
  return done;
}

bool FanSet::ReadAll() {
  return EachOf(fans, [this](Fan& fan) { return !IsUnderTest(fan) || ReadInto(fan); });
}

bool FanSet::ReadOne(int index) {
  const auto found = std::find_if(fans.begin(), fans.end(), [&](const Fan& fan) { return fan.index == index; });
  return found != fans.end() && ReadInto(*found);
}

bool FanSet::SetAllFull() {
  return EachOf(fans, [this](const Fan& fan) {
    return !IsUnderTest(fan) || !fan.fullTest || chipOf(fan.pwmChip).SetFanFullSpeed(fan.pwmIndex);
  });
}

bool FanSet::SetAllPwm() {
  return EachOf(fans, [this](const Fan& fan) {
    return !IsUnderTest(fan) || !fan.pwmTest || chipOf(fan.pwmChip).SetFanPwmPercent(fan.pwmIndex, fan.pwmDuty);
  });
}

bool FanSet::SetPwm(int index) {
  const Fan* fan = Find(index);
  return fan != nullptr && chipOf(fan->pwmChip).SetFanPwmPercent(fan->pwmIndex, fan->pwmDuty);
}

void FanSet::Wait() const { platform::TheHost().clock.Sleep(stabilizationWait_ms); }

}  // namespace panelglow
