// What a chip class answers for an operation, and what it does on the hardware for it, row by row.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <iterator>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "board/BoardBench.h"
#include "board/ChipTable.h"
#include "board/base/mblib_exception.h"
#include "harness/base/CDMException.h"

namespace panelglow {

/// A machine whose layered files say `keys`, and whose chip file is `chips`.
class KeyBench : public BoardBench {
 public:
  explicit KeyBench(const std::string& hardware, const std::string& keys = "", const std::string& chips = "")
      : BoardBench(hardware) {
    Use(keys, chips);
  }
  void Use(const std::string& keys, const std::string& chips) {
    SetFiles("[7D10]\n" + keys, "", chips);
    IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  }
};

inline std::unique_ptr<Chip> MakeChip(const std::string& name) {
  for (const ChipRow& row : ChipRows()) {
    if (row.name == name) {
      return row.make();
    }
  }
  throw std::invalid_argument(name);
}

// ---- operations

using Ask = std::function<int(Chip&)>;

inline Ask Tach(int fan) {
  return [=](Chip& chip) { return static_cast<int>(chip.ReadFanTach(fan, 0)); };
}
inline Ask Full(int fan) {
  return [=](Chip& chip) { return chip.SetFanFullSpeed(fan); };
}
inline Ask Duty(int fan, int value) {
  return [=](Chip& chip) { return chip.SetFanPwm(fan, value); };
}
inline Ask Manual(bool on) {
  return [=](Chip& chip) { return chip.SetManualFanMode(on); };
}
inline Ask Line(int line) {
  return [=](Chip& chip) { return chip.ReadLine(line); };
}

/// -1000 for a zone that cannot be read, less the value that it gives all the same.
inline Ask Zone(int zone) {
  return [=](Chip& chip) {
    int value = 0;
    return chip.ReadTemperature(zone, value) ? chip.MapTemperature(value) : -1000 - value;
  };
}

/// -1000 for a limit that cannot be read.
inline Ask Limit(int zone) {
  return [=](Chip& chip) {
    int value = 0;
    return chip.ReadLowLimitTemperature(zone, value) ? value : -1000;
  };
}

/// -1 where the class does not say.
inline int Pressed(Chip& chip) {
  bool pressed = false;
  return chip.IsPowerButtonPressed(pressed) ? int{pressed} : -1;
}
inline int Red(Chip& chip) {
  bool supported = false;
  return chip.IsPowerLedRedSupported(supported) ? int{supported} : -1;
}

// ---- rows

struct ChipCase {
  Ask ask;
  int answer;
  std::string traffic;  // in order, as BoardBench::Traffic has it
};

/// What each single word becomes, put together.
template <class Around>
std::string Each(const std::string& text, Around around) {
  std::istringstream words(text);
  std::string traffic;
  for (std::string word; words >> word;) {
    traffic += around(word);
  }
  return traffic;
}

/// Registers behind two ports, as "0A05" and "0A06": "96->05 A6<-00" is a read and a write.
inline std::string Accesses(const std::string& index, const std::string& data, const std::string& accesses) {
  return Each(accesses, [&](const std::string& access) {
    return index + "<-" + access.substr(0, 2) + " " + data + access.substr(2) + " ";
  });
}

/// The rows in their order, on one chip.
inline void ExpectCases(BoardBench& bench, Chip& chip, const std::vector<ChipCase>& cases) {
  for (std::size_t i = 0; i < cases.size(); ++i) {
    SCOPED_TRACE(chip.GetName() + " " + std::to_string(i));
    EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(cases[i].ask(chip), cases[i].answer); }), cases[i].traffic);
  }
}

/// The power LED's operations in the order save, green, red, off, blink green, blink red, restore: the accesses of
/// each, which `traffic` makes requests of; "" for none, "-" where the answer is false. A restore that has nothing to
/// put back does nothing, and nothing is saved twice.
inline void ExpectLed(BoardBench& bench, Chip& chip, const std::function<std::string(const std::string&)>& traffic,
                      const std::vector<std::string>& accesses) {
  constexpr bool (Chip::*kOperations[])() = {
      &Chip::SavePowerLedState,  &Chip::AssertPowerLedGreen, &Chip::AssertPowerLedRed,   &Chip::DeassertPowerLed,
      &Chip::BlinkPowerLedGreen, &Chip::BlinkPowerLedRed,    &Chip::RestorePowerLedState};
  std::vector<ChipCase> cases{{&Chip::RestorePowerLedState, 1, ""}};
  for (std::size_t i = 0; i < accesses.size(); ++i) {
    const bool touches = !accesses[i].empty() && accesses[i] != "-";
    cases.push_back({kOperations[i], accesses[i] != "-", touches ? traffic(accesses[i]) : ""});
    if (i == 0 || i + 1 == accesses.size()) {
      cases.push_back({kOperations[i], 1, ""});
    }
  }
  ExpectCases(bench, chip, cases);
}

/// Every operation once, but for the watch over a line's activity, which takes long, with a number for whatever it
/// wants one for. What a generic class says of a number that its lists do not have, and what the firmware refuses, is
/// left alone.
inline void AskEverything(Chip& chip, int number) {
  int value = 0;
  bool yes = false;
  std::uint8_t byte = 0;
  const std::string text = std::to_string(number);
  const std::function<void()> kOperations[] = {
      [&] { chip.ReadFanRpm(number, value, number); },
      [&] { chip.ReadFanRpmRaw(number, value, number); },
      [&] { chip.SetFanFullSpeed(number); },
      [&] { chip.SetFanPwmPercent(number, number); },
      [&] { chip.SetManualFanMode(true); },
      [&] { chip.SetManualFanMode(false); },
      [&] { chip.SaveFanControl(number); },
      [&] { chip.TakeFanControl(number); },
      [&] { chip.RestoreFanControl(number); },
      [&] { chip.ReadProcessorTemperature(number, value, true, text); },
      [&] { chip.ReadVirtualTemperature(number, true, value); },
      [&] { chip.ReadTemperature(number, value); },
      [&] { chip.ReadLowLimitTemperature(number, value); },
      [&] { chip.ReadThreshold(number, value); },
      [&] { chip.ReadEnvironmentRegister(static_cast<std::uint16_t>(number), byte); },
      [&] { chip.ReadConfigBit(0xFF, 0xFF, number, yes); },
      [&] { chip.ReadIntrusionLatch(number, true, yes); },
      [&] { chip.LockHood(number, true); },
      [&] { chip.UnlockHood(number, true); },
      [&] { chip.ReadLineByNames(static_cast<std::uint32_t>(number), text, text); },
      [&] { chip.ReadLine(number); },
      [&] { chip.ReadLineDirect(number); },
      [&] { chip.ReadLatchedPort(static_cast<std::uint16_t>(number), 1, yes); },
      [&] { chip.ReadLatchedPortDword(static_cast<std::uint16_t>(number), 1, yes); },
      [&] { chip.DetectDashCable(number, text); },
      [&] { chip.ReadRegister(number); },
  };
  const auto ask = [](const auto& operation) {
    try {
      operation();
    } catch (const mblib_exception&) {
      return;
    } catch (const CDMException&) {
      return;
    }
  };
  std::for_each(std::begin(kOperations), std::end(kOperations), ask);
  constexpr bool (Chip::*kStates[])() = {
      &Chip::SavePowerButtonState, &Chip::ArmPowerButton,          &Chip::RestorePowerButtonState,
      &Chip::SavePowerLedState,    &Chip::AssertPowerLedGreen,     &Chip::AssertPowerLedRed,
      &Chip::DeassertPowerLed,     &Chip::BlinkPowerLedGreen,      &Chip::BlinkPowerLedRed,
      &Chip::RestorePowerLedState, &Chip::SaveChargeLedState,      &Chip::AssertChargeLedWhite,
      &Chip::AssertChargeLedRed,   &Chip::RestoreChargeLedState,   &Chip::SaveHdLedState,
      &Chip::AssertHdLedRed,       &Chip::RestoreHdLedState,       &Chip::SaveWirelessLedState,
      &Chip::AssertWirelessLed,    &Chip::RestoreWirelessLedState, &Chip::SaveSpeakerLedState,
      &Chip::AssertSpeakerLed,     &Chip::AssertMicrophoneLed,     &Chip::RestoreSpeakerLedState};
  for (const auto operation : kStates) {
    ask([&] { (chip.*operation)(); });
  }
}

/// Wherever a worker is ended, what it has changed of the fans and the power LED by then can be put back.
inline void ExpectInterruptedCanBePutBack(const std::string& name, const std::string& hardware) {
  bool isDone = false;
  for (platform::sim::Microseconds step = 0; !isDone; step += 2) {
    KeyBench bench(hardware);
    const std::unique_ptr<Chip> chip = MakeChip(name);
    const std::string before = bench.machine.HardwareState();
    bench.EndAfter(step, [&] {
      chip->SetManualFanMode(true);
      chip->SavePowerLedState();
      chip->AssertPowerLedRed();
      chip->AssertPowerLedGreen();
      isDone = true;
    });
    chip->SetManualFanMode(false);
    chip->RestorePowerLedState();
    EXPECT_EQ(bench.machine.HardwareState(), before) << name << " " << step;
  }
}

}  // namespace panelglow
