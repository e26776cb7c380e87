// What the Fintek classes with registers in code do on the ports, request by request.
#include <gmock/gmock.h>

#include "board/ChipCases.h"
#include "board/chips/fin/FinF71808aChip.h"
#include "platform/Host.h"

namespace panelglow {
namespace {

// A part at 0x4E with its hardware monitor at 0xA05, and the event enable word of the power management block.
std::string Hardware(const std::string& settings) {
  return "[[chip]]\nname = \"s\"\nkind = \"super-io\"\nbase = 0x4E\n[chip.registers]\n2A = 0x11\n2B = 0x22\n"
         "[[chip.device]]\nnumber = 4\n[chip.device.registers]\n30 = 1\n60 = 0x0A\n61 = 0x00\n"
         "[[chip.device]]\nnumber = 6\n[chip.device.registers]\n30 = 1\nF2 = 0x08\nE2 = 0x80\nB2 = 0x20\n"
         "[[chip.device]]\nnumber = 10\n[chip.device.registers]\n30 = 1\nF8 = 0x20\nF9 = 0x21\n"
         "[chip.environment]\ndevice = 4\n[chip.environment.settings]\n" +
         settings +
         "[chip.environment.sensors]\nA0 = 0x0F\nA1 = 0xFE\nB0 = 0x0F\nB1 = 0xFF\nC0 = 0x01\nC1 = 0x35\n72 = 0x2A\n"
         "76 = 0x80\n[chip.environment.intrusion]\nstatus = 3\nstatus_bit = 0\nwas_opened = true\n"
         "[[chip]]\nname = \"e\"\nkind = \"gpio-block\"\nbase = 0x802\ninitial = [0xFF]\n";
}

class FinBench : public BoardBench {
 public:
  explicit FinBench(const std::string& keys = "", const std::string& settings = "96 = 0x05\n")
      : BoardBench(Hardware(settings)) {
    SetFiles("[7D10]\n" + keys, "", "");
    IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  }
};

const std::string kOpen = "004E<-87 004E<-87 ";
const std::string kClose = "004E<-AA ";

std::string Config(const std::string& requests) { return kOpen + requests + kClose; }

TEST(FinChip, ThePowerLedIsMultiFunctionSelectByMultiFunctionSelect) {
  FinBench bench;
  FinChip chip;
  bool supported = false;
  ExpectCases(bench, chip,
              {{&Chip::RestorePowerLedState, 1, ""},
               {[&](Chip& c) { return c.IsPowerLedRedSupported(supported) && supported; }, 1, ""},
               {&Chip::SavePowerLedState, 1,
                Config("004E<-2B 004F->22 ") + Config("004E<-2B 004F<-60 ") + Config("004E<-2A 004F->11 ")},
               {&Chip::SavePowerLedState, 1, ""},
               {&Chip::AssertPowerLedGreen, 1, Config("004E<-2A 004F<-C0 ")},
               {&Chip::AssertPowerLedRed, 1, Config("004E<-2A 004F<-30 ")},
               {&Chip::DeassertPowerLed, 1, Config("004E<-2A 004F<-00 ")},
               {&Chip::BlinkPowerLedGreen, 0, ""},
               {&Chip::BlinkPowerLedRed, 0, ""},
               {&Chip::RestorePowerLedState, 1, Config("004E<-2A 004F<-11 ") + Config("004E<-2B 004F<-22 ")},
               {&Chip::RestorePowerLedState, 1, ""}});
}

TEST(FinChip, FansAndZonesAreRegistersOfTheMonitor) {
  FinBench bench;
  FinChip chip;
  int value = 0;
  const auto tach = [](int fan) { return [fan](Chip& c) { return static_cast<int>(c.ReadFanTach(fan, 0)); }; };
  const auto full = [](int fan) { return [fan](Chip& c) { return c.SetFanFullSpeed(fan); }; };
  const auto pwm = [](int fan) { return [fan](Chip& c) { return c.SetFanPwm(fan, 0x180); }; };
  const auto zone = [&](int number) {
    return [&value, number](Chip& c) { return c.ReadTemperature(number, value) ? c.MapTemperature(value) : -1; };
  };
  ExpectCases(bench, chip,
              {{tach(1), 4094, "0A05<-A0 0A06->0F 0A05<-A1 0A06->FE "},
               {tach(2), 0xFFFF, "0A05<-B0 0A06->0F 0A05<-B1 0A06->FF "},
               {tach(3), 0x135, "0A05<-C0 0A06->01 0A05<-C1 0A06->35 "},
               {tach(0), 0xFFFF, ""},
               {tach(4), 0xFFFF, ""},
               {&Chip::RestoreFanState, 1, ""},
               {pwm(1), 1, "0A05<-A3 0A06<-80 "},
               {pwm(4), 0, ""},
               {full(2), 1, "0A05<-96 0A06->05 0A05<-96 0A06<-FF 0A05<-B3 0A06<-FF "},
               {full(3), 1, "0A05<-C3 0A06<-FF "},
               {full(0), 0, ""},
               {[](Chip& c) { return c.SetManualFanMode(false); }, 1, "0A05<-96 0A06<-05 "},
               {[](Chip& c) { return c.SetManualFanMode(true); }, 1, "0A05<-96 0A06<-FF "},
               {&Chip::SaveFanState, 1, ""},
               {&Chip::RestoreFanState, 1, "0A05<-96 0A06<-05 "},
               {zone(1), 0x2A, "0A05<-72 0A06->2A "},
               {zone(2), 0, "0A05<-74 0A06->00 "},
               {zone(3), 255, "0A05<-76 0A06->80 "},
               {zone(4), -1, ""}});
  EXPECT_EQ(chip.TachToRpm(1000, 7), 1500);
  EXPECT_EQ(chip.TachToRpm(0, 7) + chip.TachToRpm(0xFFFF, 7), 0);
}

TEST(FinChip, LinesAreLevelsOrLatches) {
  FinBench bench;
  FinChip chip;
  const auto line = [](int number) { return [number](Chip& c) { return c.ReadLine(number); }; };
  const auto levels = [](const char* reg, const char* value) {
    return Config(std::string("004E<-07 004F<-06 004E<-") + reg + " 004F->" + value + " ");
  };
  bool latched = false;
  ExpectCases(bench, chip,
              {{line(237), 4, "0A05<-03 0A06->01 0A05<-03 0A06<-01 10ms 0A05<-03 0A06->00 "},
               {line(237), 4, "0A05<-03 0A06->00 10ms 0A05<-03 0A06->00 "},
               {line(238), 3, "4449->FF 4449<-FD 100ms 4444->FF "},
               {line(3), 3, levels("F2", "08")},
               {line(0), 4, levels("F2", "08")},
               {line(17), 3, levels("E2", "80")},
               {line(20), 4, levels("D2", "00")},
               {line(33), 4, levels("C2", "00")},
               {line(45), 3, levels("B2", "20")},
               {line(4), -1, ""},
               {line(18), -1, ""},
               {line(46), -1, ""},
               {line(-1), -1, ""},
               {[&](Chip& c) { return c.ReadIntrusionLatch(2, true, latched) && latched; }, 1, "0802->FFFF "}});
}

TEST(FinChip, ThePowerButtonIsAnEventThatCanBeTakenAway) {
  FinBench bench;
  FinChip chip;
  bool pressed = false;
  ExpectCases(bench, chip,
              {{&Chip::SavePowerButtonState, 1, "0802->FFFF "},
               {&Chip::ArmPowerButton, 1, "0802<-FEFE 0802->FEFE "},
               {[&](Chip& c) { return c.IsPowerButtonPressed(pressed) && pressed; }, 1, "0800->FFFF "},
               {&Chip::RestorePowerButtonState, 1, "0800<-0100 0802<-FFFF 0802->FFFF "}});
}

TEST(FinChip, WithoutAPowerManagementBlockNoEventCanBeTakenAway) {
  FinBench bench("chip.fin.pmbar=0x900\n");
  FinChip chip;
  ExpectCases(
      bench, chip,
      {{&Chip::RestorePowerButtonState, 0, "0900<-0100 0902<-0000 0902->FFFF 100ms 0902->FFFF 100ms 0902->FFFF "},
       {&Chip::SavePowerButtonState, 1, "0902->FFFF "},
       {&Chip::ArmPowerButton, 0, "0902<-FEFE 0902->FFFF "},
       {&Chip::RestorePowerButtonState, 1, "0900<-0100 0902<-FFFF 0902->FFFF "}});
}

TEST(FinChip, EveryKeyReplacesItsValue) {
  const std::string keys =
      "chip.fin.hwmbar=0x295\nchip.fin.cfgbar=0x2E\nchip.fin.multifunction_select2_register.green=1\n"
      "chip.fin.multifunction_select2_register.red=2\n"
      "chip.fin.multifunction_select3_register.gpios15_16=3\n";
  const auto config = [](const std::string& reg, const std::string& data) {
    return "002E<-87 002E<-87 002E<-" + reg + " 002F" + data + " 002E<-AA ";
  };
  for (const bool byShortKeys : {false, true}) {
    FinBench bench(keys +
                   (byShortKeys ? "chip.fin.reg2Agreen=0x11\nchip.fin.reg2Ared=0x12\nchip.fin.reg2B=0x13\n" : ""));
    FinChip chip;
    const std::string digit = byShortKeys ? "1" : "0";
    ExpectCases(bench, chip,
                {{&Chip::SaveFanState, 1, "0295<-96 0296->FF "},
                 {&Chip::SavePowerLedState, 1,
                  config("2B", "->FF") + config("2B", "<-" + digit + "3") + config("2A", "->FF")},
                 {&Chip::AssertPowerLedGreen, 1, config("2A", "<-" + digit + "1")},
                 {&Chip::AssertPowerLedRed, 1, config("2A", "<-" + digit + "2")}});
  }
}

// As "fin" but for its rows; the part is at the monitor's ports of the bench, its LED pins at 0x4E.
TEST(FinF71808aChip, HasALedDeviceAndFanRegistersOfItsOwn) {
  FinBench bench("chip.fin_f71808a.cfgbar=0x4E\nchip.fin_f71808a.multifunction_select2_register.green=0xC1\n",
                 "96 = 0x01\n9F = 0x09\nA3 = 0x31\nB3 = 0x32\n");
  FinF71808aChip chip;
  const auto led = [](const std::string& request) { return Config("004E<-07 004F<-0A 004E<-" + request + " "); };
  const std::string fans = "0A05<-9F 0A06->09 0A05<-A3 0A06->31 0A05<-B3 0A06->32 ";
  ExpectCases(
      bench, chip,
      {{&Chip::SavePowerLedState, 1, led("F9 004F->21") + led("F8 004F->20")},
       {&Chip::AssertPowerLedGreen, 1, led("F9 004F<-C1")},
       {&Chip::AssertPowerLedRed, 1, led("F9 004F<-04") + led("F8 004F<-02")},
       {&Chip::DeassertPowerLed, 1, led("F8 004F<-00") + led("F9 004F<-00")},
       {&Chip::RestorePowerLedState, 1, led("F9 004F<-21") + led("F8 004F<-20")},
       {[](Chip& c) { return c.SetFanFullSpeed(1); }, 1,
        fans + "0A05<-9F 0A06<-00 0A05<-96 0A06<-03 0A05<-A3 0A06<-FF "},
       {&Chip::RestoreFanState, 1, "0A05<-96 0A06<-05 0A05<-9F 0A06<-09 0A05<-A3 0A06<-31 0A05<-B3 0A06<-32 "}});
}

// A worker that overruns is ended at whatever request it stands; what it has changed by then can be put back.
TEST(FinChip, ASaveThatIsInterruptedCanBePutBack) {
  constexpr platform::sim::Microseconds kMostSteps_us = 40;  // a save is fifteen requests of 2 us
  for (platform::sim::Microseconds step = 0; step < kMostSteps_us; ++step) {
    FinBench bench;
    FinChip chip;
    const std::string before = bench.machine.HardwareState();
    const platform::ThreadHandle worker = platform::TheHost().threads.Start("worker", [&] {
      chip.SavePowerLedState();
      chip.AssertPowerLedGreen();
    });
    bench.machine.Time().SleepFor(step);
    platform::TheHost().threads.Terminate(worker);
    chip.RestorePowerLedState();
    EXPECT_EQ(bench.machine.HardwareState(), before) << step;
  }
}

}  // namespace
}  // namespace panelglow
