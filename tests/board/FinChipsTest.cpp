// What the Fintek classes with registers in code do on the ports, request by request.
#include <gmock/gmock.h>

#include <climits>
#include <map>

#include "board/ChipCases.h"
#include "board/base/mblib_exception.h"
#include "board/chips/fin/FinF71808aChip.h"
#include "board/chips/fin/FinF71808eChip.h"
#include "board/chips/fin/FinF71855Chip.h"
#include "board/chips/fin/FinF71863Chip.h"
#include "board/chips/fin/FinF8000Chip.h"

namespace panelglow {
namespace {

// A part at 0x4E with its hardware monitor at 0xA05, and the event enable word of the power management block.
std::string Hardware(const std::string& settings, const std::string& caseStatus) {
  return "[[chip]]\nname = \"s\"\nkind = \"super-io\"\nbase = 0x4E\n[chip.registers]\n2A = 0x11\n2B = 0x22\n"
         "[[chip.device]]\nnumber = 1\n[chip.device.registers]\nF9 = 0x1F\n"
         "[[chip.device]]\nnumber = 4\n[chip.device.registers]\n30 = 1\n60 = 0x0A\n61 = 0x00\n"
         "[[chip.device]]\nnumber = 6\n[chip.device.registers]\n30 = 1\nF2 = 0x08\nE2 = 0x80\nB2 = 0x20\n"
         "[[chip.device]]\nnumber = 10\n[chip.device.registers]\n30 = 1\nF8 = 0x20\nF9 = 0x21\n"
         "[chip.environment]\ndevice = 4\n[chip.environment.settings]\n" +
         settings +
         "[chip.environment.sensors]\nA0 = 0x0F\nA1 = 0xFE\nB0 = 0x0F\nB1 = 0xFF\nC0 = 0x01\nC1 = 0x35\n72 = 0x2A\n"
         "76 = 0x80\n[chip.environment.intrusion]\nstatus = " +
         caseStatus +
         "\nstatus_bit = 0\nwas_opened = true\n"
         "[[chip]]\nname = \"e\"\nkind = \"gpio-block\"\nbase = 0x802\ninitial = [0xFF]\n";
}

class FinBench : public KeyBench {
 public:
  explicit FinBench(const std::string& keys = "", const std::string& settings = "96 = 0x05\n",
                    const std::string& caseStatus = "3")
      : KeyBench(Hardware(settings, caseStatus), keys) {}
};

const std::string kOpen = "004E<-87 004E<-87 ";
const std::string kClose = "004E<-AA ";

std::string Config(const std::string& requests) { return kOpen + requests + kClose; }

std::string ConfigOf(const std::string& accesses) { return Config(Accesses("004E", "004F", accesses)); }
std::string EachConfig(const std::string& accesses) { return Each(accesses, ConfigOf); }
std::string Monitor(const std::string& accesses) { return Accesses("0A05", "0A06", accesses); }

TEST(FinChip, ThePowerLedIsMultiFunctionSelectByMultiFunctionSelect) {
  FinBench bench;
  FinChip chip;
  ExpectLed(bench, chip, EachConfig,
            {"2B->22 2B<-60 2A->11", "2A<-C0", "2A<-30", "2A<-00", "-", "-", "2A<-11 2B<-22"});
  ExpectCases(bench, chip, {{Red, 1, ""}});
}

TEST(FinChip, FansAndZonesAreRegistersOfTheMonitor) {
  FinBench bench;
  FinChip chip;
  ExpectCases(bench, chip,
              {{Tach(1), 4094, "0A05<-A0 0A06->0F 0A05<-A1 0A06->FE "},
               {Tach(2), 0xFFFF, "0A05<-B0 0A06->0F 0A05<-B1 0A06->FF "},
               {Tach(3), 0x135, "0A05<-C0 0A06->01 0A05<-C1 0A06->35 "},
               {Tach(0), 0xFFFF, ""},
               {Tach(4), 0xFFFF, ""},
               {&Chip::RestoreFanState, 1, ""},
               {Duty(1, 0x180), 1, "0A05<-A3 0A06<-80 "},
               {Duty(4, 0x180), 0, ""},
               {Full(2), 1, "0A05<-96 0A06->05 0A05<-96 0A06<-FF 0A05<-B3 0A06<-FF "},
               {Full(3), 1, "0A05<-C3 0A06<-FF "},
               {Full(0), 0, ""},
               {Manual(false), 1, "0A05<-96 0A06<-05 "},
               {Manual(true), 1, "0A05<-96 0A06<-FF "},
               {&Chip::SaveFanState, 1, ""},
               {&Chip::RestoreFanState, 1, "0A05<-96 0A06<-05 "},
               {Zone(1), 0x2A, "0A05<-72 0A06->2A "},
               {Zone(2), 0, "0A05<-74 0A06->00 "},
               {Zone(3), 255, "0A05<-76 0A06->80 "},
               {Zone(4), -1000, ""}});
  EXPECT_EQ(chip.TachToRpm(1000, 7), 1500);
  EXPECT_EQ(chip.TachToRpm(0, 7) + chip.TachToRpm(0xFFFF, 7), 0);
}

TEST(FinChip, LinesAreLevelsOrLatches) {
  FinBench bench;
  FinChip chip;
  const auto levels = [](const char* reg, const char* value) {
    return Config(std::string("004E<-07 004F<-06 004E<-") + reg + " 004F->" + value + " ");
  };
  bool latched = false;
  ExpectCases(bench, chip,
              {{Line(237), 4, "0A05<-03 0A06->01 0A05<-03 0A06<-01 10ms 0A05<-03 0A06->00 "},
               {Line(237), 4, "0A05<-03 0A06->00 10ms 0A05<-03 0A06->00 "},
               {Line(238), 3, "4449->FF 4449<-FD 100ms 4444->FF "},
               {Line(3), 3, levels("F2", "08")},
               {Line(0), 4, levels("F2", "08")},
               {Line(17), 3, levels("E2", "80")},
               {Line(20), 4, levels("D2", "00")},
               {Line(33), 4, levels("C2", "00")},
               {Line(45), 3, levels("B2", "20")},
               {Line(4), -1, ""},
               {Line(18), -1, ""},
               {Line(46), -1, ""},
               {Line(INT_MIN), -1, ""},
               {[&](Chip& c) { return c.ReadIntrusionLatch(2, true, latched) && latched; }, 1, "0802->FFFF "},
               {[&](Chip& c) { return c.ReadIntrusionLatch(INT_MAX, true, latched); }, 1, "07FF->FFFF "}});
}

TEST(FinChip, ThePowerButtonIsAnEventThatCanBeTakenAway) {
  const auto expect = [](const std::string& keys, bool isTaken, const std::string& status, const std::string& enable,
                         const std::string& armed) {
    FinBench bench(keys);
    FinChip chip;
    ExpectCases(bench, chip,
                {{&Chip::RestorePowerButtonState, 1, ""},  // nothing is kept yet
                 {&Chip::SavePowerButtonState, 1, enable + "->FFFF "},
                 {&Chip::ArmPowerButton, isTaken, enable + "<-FEFE " + enable + "->" + armed + " "},
                 {Pressed, 1, status + "->FFFF "},
                 {&Chip::RestorePowerButtonState, 1, status + "<-0100 " + enable + "<-FFFF " + enable + "->FFFF "}});
  };
  expect("", true, "0800", "0802", "FEFE");
  expect("chip.fin.pmbar=0x900\n", false, "0900", "0902", "FFFF");  // nobody there
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
  ExpectLed(bench, chip,
            [](const std::string& accesses) {
              return Each(accesses, [](const std::string& access) { return ConfigOf("07<-0A " + access); });
            },
            {"F9->21 F8->20", "F9<-C1", "F9<-04 F8<-02", "F8<-00 F9<-00", "-", "-", "F9<-21 F8<-20"});
  ExpectCases(bench, chip,
              {{Full(1), 1, Monitor("9F->09 A3->31 B3->32 9F<-00 96<-03 A3<-FF")},
               {&Chip::RestoreFanState, 1, Monitor("96<-05 9F<-09 A3<-31 B3<-32")}});
}

// ---- fans that follow a curve: four bounds of its sections, then five duties

// What the registers of the benches below hold; the others hold 0.
const std::string kCurves = "96 = 0x8A\nA6 = 0x31\nB6 = 0x32\nBF = 0x3B\nC6 = 0x33\nCF = 0x3C\nD1 = 0x3D\n";
const std::map<std::string, std::string> kHeld = {{"96", "8A"}, {"A6", "31"}, {"B0", "0F"}, {"B6", "32"},
                                                  {"BF", "3B"}, {"C0", "01"}, {"C6", "33"}, {"CF", "3C"},
                                                  {"D1", "3D"}, {"72", "2A"}};
const std::string kTenA = "A6 A7 A8 A9 AA AB AC AD AE AF ";
const std::string kTenB = "B6 B7 B8 B9 BA BB BC BD BE BF ";
const std::string kTenC = "C6 C7 C8 C9 CA CB CC CD CE CF ";
const std::string kElevenOfTwo = "96 " + kTenA + "B0 " + kTenB + "C0 ";

// Each of the registers with what it holds, in each of the directions.
std::string Held(const std::string& registers, const std::vector<std::string>& directions) {
  return Monitor(Each(registers, [&](const std::string& reg) {
    const auto value = kHeld.find(reg);
    std::string accesses;
    for (const std::string& direction : directions) {
      accesses.append(reg).append(direction).append(value == kHeld.end() ? "00" : value->second).append(" ");
    }
    return accesses;
  }));
}

std::string Flat(char curve, const std::string& duty) {
  std::string accesses;
  for (const char digit : std::string("6789ABCDE")) {
    accesses.append({curve, digit}).append("<-").append(digit <= '9' ? "00" : duty).append(" ");
  }
  return Monitor(accesses);
}

std::string AllFlat(const std::string& duty) { return Flat('C', duty) + Flat('B', duty) + Flat('A', duty); }

// The registers of the zones from 1 on, and no zone behind them.
void ExpectZones(BoardBench& bench, Chip& chip, const std::vector<std::string>& registers) {
  std::vector<ChipCase> cases = {{Zone(0), -1000, ""}, {Zone(static_cast<int>(registers.size()) + 1), -1000, ""}};
  for (std::size_t i = 0; i < registers.size(); ++i) {
    cases.push_back({Zone(static_cast<int>(i) + 1), registers[i] == "72" ? 0x2A : 0, Held(registers[i], {"->"})});
  }
  ExpectCases(bench, chip, cases);
}

TEST(FinF8000Chip, KeepsWhatThePartMakesOfItsFansRegisters) {
  // The last register of the first curve does not hold what it is given back.
  FinBench bench("chip.fin_f8000.multifunction_select2_register.green=0x55\nchip.fin.reg2Ared=0x46\n", kCurves,
                 "0xAF");
  FinF8000Chip chip;
  const auto with = [](std::string traffic, const std::string& old, const std::string& last) {
    return traffic.replace(traffic.find(Monitor(old)), Monitor(old).size(), Monitor(last));
  };
  const std::string registers = "96 " + kTenA + kTenB + kTenC;
  const std::string restored = Held(registers, {"<-", "->"});
  ExpectCases(bench, chip,
              {{&Chip::RestoreFanState, 1, ""},
               {Full(1), 1, with(Held(registers, {"->"}), "AF->00", "AF->01") + Monitor("96<-85") + Flat('A', "FF")},
               {&Chip::RestoreFanState, 1, with(restored, "AF<-00 AF->00", "AF<-01 AF->00")},
               {&Chip::RestoreFanState, 1, restored},
               {Full(INT_MAX), 0, Monitor("96<-85")},
               {Duty(2, 0x40), 1, Flat('B', "40")}});
  ExpectLed(bench, chip, ConfigOf, {"2A->11", "2A<-55", "2A<-46", "", "-", "-", "2A<-11"});
  ExpectZones(bench, chip, {"70", "72", "74"});
}

TEST(FinF71858Chip, TakesAllFansTheLastOneFirst) {
  FinBench bench("chip.fin_f71858.multifunction_select2_register.red=0x03\n", kCurves);
  FinF71858Chip chip;
  ExpectCases(bench, chip,
              {{Duty(3, 0x180), 1, Flat('C', "80")},
               {Full(0), 1, Held(kElevenOfTwo, {"->"}) + Monitor("96<-15") + AllFlat("FF")},
               {Full(2), 1, Flat('B', "FF")},
               {Duty(INT_MIN, 0x33), 1, AllFlat("33")},
               {&Chip::RestoreFanState, 1, Held(kElevenOfTwo, {"<-"})}});
  ExpectLed(bench, chip, [](const std::string& led) { return ConfigOf("07<-01 " + led); },
            {"F9->1F", "F9<-C0", "F9<-03", "F9<-00", "-", "-", "F9<-1F"});
}

TEST(FinF71858Chip, AZoneMayBeWhatTheProcessorSays) {
  const auto expect = [](const std::string& settings, int degrees, const std::string& traffic, bool isTold) {
    FinBench bench("", settings);
    FinF71858Chip chip;
    ExpectCases(bench, chip, {{Zone(2), degrees, traffic}});
    EXPECT_EQ(bench.machine.Output().find("LogMessage 14 8 \"Invalid Temp Read, Retrying..\"") == 0, isTold);
    ExpectCases(bench, chip, {{Zone(1), 0, Monitor("70->00")}, {Zone(8), 0, Monitor("7E->00")}});
  };
  expect("0A = 0xFE\n0C = 0x20\n", 42, Monitor("0A->FE 72->2A"), false);
  expect("0A = 0x01\n0C = 0x60\n", 42 + 105 - 96, Monitor("0A->01 0C->60 72->2A"), false);
  expect("0A = 0x01\n0C = 0x2A\n", 105, Monitor("0A->01 0C->2A 72->2A"), false);
  expect("0A = 0x01\n0C = 0x29\n", 106, Monitor("0A->01 0C->29 72->2A") + "100ms " + Monitor("72->2A"), true);
}

TEST(FinF71808eChip, HasARegisterForEachColour) {
  FinBench bench("chip.fin_f71808e.cfgbar=0x4E\nchip.fin_f71808e.multifunction_select2_register.red=0x03\n", kCurves);
  FinF71808eChip chip;
  ExpectLed(bench, chip, [](const std::string& led) { return ConfigOf("07<-0A " + led); },
            {"F9->21 F8->20", "F8<-01 F9<-00", "F8<-00 F9<-03", "F8<-00 F9<-00", "-", "-", "F9<-21 F8<-20"});
  ExpectCases(bench, chip,
              {{Full(-1), 1, Held(kElevenOfTwo, {"->"}) + Monitor("96<-15") + AllFlat("FF")},
               {Zone(2), 0x2A, Monitor("0A->00 72->2A")}});
}

TEST(FinF71855Chip, BlinksItsLedAndKeepsItsFansModes) {
  FinBench bench("chip.fin_f71855.hwmbar=0xA05\nchip.fin_f71855.cfgbar=0x4E\n", kCurves);
  FinF71855Chip chip;
  ExpectLed(bench, chip, [](const std::string& led) { return ConfigOf("07<-01 " + led); },
            {"F9->1F", "-", "-", "-", "F9<-32", "F9<-23", "F9<-1F"});
  const std::string saved = "96 D0 D1 " + kTenA + "B0 " + kTenB + "C0 " + kTenC + "D0";
  ExpectCases(bench, chip,
              {{Full(0), 1, Held(saved, {"->"}) + Monitor("96<-15") + AllFlat("FF")},
               {&Chip::RestoreFanState, 1, Held(saved, {"<-"})},
               {Duty(1, 7), 1, Flat('A', "07")}});
  ExpectZones(bench, chip, {"70", "72", "74", "75", "7F"});
}

// ---- an LED by lists of the files

TEST(FinF71863Chip, BlinksByListsAndChangesNoRegisterThatItDoesNotSave) {
  {
    FinBench bench;
    FinF71863Chip chip;
    ExpectLed(bench, chip, EachConfig,
              {"2B->22 2A->11 2B->22 2A->11", "2A<-C0", "2A<-30", "2A<-00", "2B<-20 2A<-C0", "2B<-40 2A<-30",
               "2A<-11 2B<-22"});
  }
  {
    FinBench bench("test.powerled.primary.data_blink=0x2C:0x1FF,43:7\ntest.powerled.secondary.data_blink=undef\n");
    FinF71863Chip chip;
    ExpectLed(bench, chip, EachConfig, {"2C->00 2B->22", "-", "-", "-", "2C<-FF 2B<-07", "-", "2B<-22 2C<-00"});
  }
  FinBench bench("test.powerled.primary.data_blink=0x2C\n");
  EXPECT_THROW(FinF71863Chip(), mblib_exception);
}

// Its own defaults stand over the keys of its base. The ports are nobody's.
TEST(FinFamily, EveryClassHasItsOwnDefaults) {
  const auto expect = [](Chip& chip, BoardBench& bench, const std::string& monitor, const std::string& config,
                         const std::string& accesses) {
    const auto data = [](std::string port) { return ++port.back(), port; };
    const std::string key = config + "<-87 ";
    bool red = false;
    ExpectCases(
        bench, chip,
        {{Zone(1), 255, Accesses(monitor, data(monitor), "70->FF")},
         {[](Chip& c) { return c.AssertPowerLedRed() || c.BlinkPowerLedRed(); }, 1,
          key + key + Accesses(config, data(config), accesses) + config + "<-AA "},
         {[&](Chip& c) { return c.IsPowerLedRedSupported(red) && c.IsPowerButtonPressed(red); }, 1, "0800->FFFF "}});
  };
  const std::string keys = "chip.fin.hwmbar=0x111\nchip.fin.cfgbar=0x111\nchip.fin.pmbar=0x111\n";
  KeyBench bench("", keys);
  FinF8000Chip f8000;
  FinF71858Chip f71858;
  FinF71855Chip f71855;
  bench.SetFiles("[7D10]\n" + keys + "chip.fin_f71858.cfgbar=0x111\nchip.fin_f71858.hwmbar=0x111\n", "", "");
  FinF71808eChip f71808e;
  expect(f8000, bench, "0A05", "004E", "2A<-45");
  expect(f71858, bench, "0A05", "004E", "07<-01 F9<-02");
  expect(f71855, bench, "0295", "002E", "07<-01 F9<-23");
  expect(f71808e, bench, "0A05", "002E", "07<-0A F8<-00 F9<-01");
}

TEST(FinFamily, ATakeoverThatIsInterruptedCanBePutBack) {
  for (const char* name : {"fin", "fin_f71858"}) {
    ExpectInterruptedCanBePutBack(name, Hardware("96 = 0x05\n", "3"));
  }
}

}  // namespace
}  // namespace panelglow
