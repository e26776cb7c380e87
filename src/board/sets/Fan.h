// One fan of a board: where it is read and driven, what is tested of it, and what was read.
#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <vector>

namespace panelglow {

/// The columns of a fan's readings.
enum class FanReading : unsigned { kNominal, kFull, kPwm };
inline constexpr std::size_t kFanReadings = 3;

/// Revolutions per minute that are accepted.
struct FanLimits {
  int min = 9;
  int max = 99999;
};

inline constexpr int kNotRead = -1;  // in place of a speed

struct Fan {
  int index = 0;         // its number in the keys, from 1
  bool present = false;  // the files have it
  std::string name;
  std::string tachChip;
  int tachIndex = 0;  // the chip's number for it
  std::string gpioChip;
  int gpio = -1;  // line that tells whether the fan is plugged in; -1: there is none
  bool reversedLogic = false;
  int tachMultiplier = 1;
  std::string pwmChip;
  int pwmIndex = 0;
  bool pwmApply = false;       // a duty has to be set for the fan to turn
  int pwmDutyDetect = 100;     // ... this one, in percent, while it is looked for
  int cfgRegIndex = 0;         // the chip's number for how it drives the fan; 0: that of the duty
  bool syntheticMode = false;  // the chip drives it by a speed of its own, not by a duty
  std::string detectionStatus = "ERROR: no detection performed";
  bool tested = true;
  bool nominalTest = true;
  FanLimits nominal;
  bool pwmTest = true;
  int pwmDuty = 50;  // percent
  FanLimits pwm;
  bool fullTest = true;
  FanLimits full;
  std::array<int, kFanReadings> readings{kNotRead, kNotRead, kNotRead};  // rpm, by FanReading
  std::string readingTime;                                               // of the last one, "20260131 235959"
};

/// Fans that are tested together.
struct FanGroup {
  std::string name;
  std::vector<int> fans;  // their numbers
};

}  // namespace panelglow
