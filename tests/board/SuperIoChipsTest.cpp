// What the generic Super-I/O classes do on the ports, request by request, and what they say of data that they cannot
// use.
#include <gmock/gmock.h>

#include <functional>

#include "board/ChipCases.h"
#include "board/base/mblib_exception.h"
#include "board/chips/generic/GFintekChip.h"
#include "board/chips/generic/GIt8702Chip.h"
#include "platform/Host.h"

namespace panelglow {
namespace {

const std::string kPorts =
    "config.index.port=0x2E\nconfig.data.port=47\nconfig.mode.enter.sequence=0x87,1 0x55,,0x55\n"
    "config.mode.exit.sequence=0xAA\nenvironment.index.reg=5\nenvironment.data.reg=6\n";
const std::string kBases = kPorts + "hwmbar=0xA10\ngpiobar=0xA20\n";
const std::string kLed = kBases + "powerled.ldn=7\npowerled.state.regs=0x26, 0xF8\n";

// Configuration mode, open and closed: by a key, and on the ITE line by a bit of register 2, which reads as 0.
const std::string kEnter = "002E<-87 002E<-01 002E<-55 002E<-55 ";
const std::string kEnterLed = kEnter + "002E<-07 002F<-07 ";
const std::string kExit = "002E<-AA ";
const std::string kIteExit = "002E<-02 002F->00 002F<-02 ";

// A part at 0x2E: environment controller at 0xA10, level ports from 0xA20 on.
class SuperIoBench : public BoardBench {
 public:
  explicit SuperIoBench(const std::string& family, const std::string& environment = "", const char* id = "0x02")
      : BoardBench("[[chip]]\nname = \"s\"\nkind = \"super-io\"\nfamily = \"" + family +
                   "\"\nenter = [0x87, 0x01, 0x55, 0x55]\nchip_id = [0x87, 0x20, " + id +
                   "]\n[chip.registers]\n26 = 0x0C\n"
                   "[[chip.device]]\nnumber = 4\n[chip.device.registers]\n30 = 1\n60 = 0x0A\n61 = 0x10\n64 = 0x0B\n"
                   "[[chip.device]]\nnumber = 7\n[chip.device.registers]\n30 = 1\n62 = 0x0A\n63 = 0x20\nF8 = 0x16\n"
                   "F2 = 0x20\nE2 = 0x80\nD2 = 0x01\nC2 = 0x08\nB2 = 0x10\n"
                   "[chip.environment]\ndevice = 4\n" +
                   environment + "[[chip.gpio]]\n[[chip.gpio]]\ninputs = 0x08\n") {}

  void SetChipText(const std::string& name, const std::string& text) {
    SetFiles("[7D10]\n", "", "[" + name + "]\n" + text);
    IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  }

  template <class Class>
  std::unique_ptr<Class> Make(const std::string& text) {
    auto chip = std::make_unique<Class>();
    SetChipText(chip->GetName(), text);
    chip->Initialize();
    return chip;
  }
};

template <class Class>
void Expect(SuperIoBench&& bench, const std::string& text, const std::vector<ChipCase>& cases) {
  const auto chip = bench.Make<Class>(text);
  ExpectCases(bench, *chip, cases);
  EXPECT_THAT(bench.machine.HardwareState(), ::testing::HasSubstr("configuration mode = closed"));
}

std::string TextOf(const std::function<void()>& action) {
  try {
    action();
  } catch (const mblib_exception& error) {
    return error.what();
  }
  return "";
}

// ---- the power LED

// On a class that leaves configuration mode by `exit` and has blink lists that come to these requests, or none.
std::vector<ChipCase> LedCases(const std::string& exit, bool deasserts, const std::string& green,
                               const std::string& red) {
  const auto run = [&](const std::string& list) { return list.empty() ? list : kEnterLed + list + exit; };
  return {{&Chip::RestorePowerLedState, true, ""},
          {&Chip::SavePowerLedState, true, run("002E<-26 002F->0C 002E<-F8 002F->16 ")},
          {&Chip::SavePowerLedState, true, ""},
          {&Chip::AssertPowerLedGreen, false, ""},
          {&Chip::AssertPowerLedRed, false, ""},
          {&Chip::DeassertPowerLed, deasserts, ""},
          {&Chip::BlinkPowerLedGreen, !green.empty(), run(green)},
          {&Chip::BlinkPowerLedRed, !red.empty(), run(red)},
          {&Chip::RestorePowerLedState, true, run("002E<-26 002F<-0C 002E<-F8 002F<-16 ")},
          {&Chip::RestorePowerLedState, true, ""},
          {[supported = false](Chip& chip) mutable { return chip.IsPowerLedRedSupported(supported) && supported; },
           true, ""}};
}

TEST(SuperIoChips, EachPowerLedOperationIsItsRequestsInOrder) {
  const std::string numbers =
      kLed + "powerled.green.blink.sequence=0x26:12,0xF8:0x103\npowerled.red.blink.sequence=248:3.1\n";
  Expect<GSioChip>(SuperIoBench("plain"), numbers, LedCases(kExit, false, "", ""));
  Expect<GFintekChip>(SuperIoBench("plain"), numbers,
                      LedCases(kExit, false, "002E<-26 002F<-0C 002E<-F8 002F<-03 ", "002E<-F8 002F<-00 "));
  const std::string names =
      kLed +
      "powerled.color.secondary.gpio=57\npowerled.green.blink.sequence=0x26:0x0C,0xF8:primary_led 0xF9:2\n"
      "powerled.red.blink.sequence=0xF8:secondary_led,0xF9:0x03:0xFA\n";
  const auto ite = LedCases(kIteExit, true, "002E<-26 002F<-0C 002E<-F8 002F<-12 002E<-F9 002F<-02 ",
                            "002E<-F8 002F<-2F 002E<-F9 002F<-03 ");
  Expect<GIteChip>(SuperIoBench("ite"), names, ite);
  Expect<GIt8702Chip>(SuperIoBench("ite"), names, ite);
}

TEST(SuperIoChips, AThreadThatIsEndedAnywhereLeavesConfigurationMode) {
  constexpr platform::sim::Microseconds kMostSteps_us = 40;  // a save is thirteen requests of 2 us
  for (platform::sim::Microseconds step = 0; step < kMostSteps_us; ++step) {
    SuperIoBench bench("ite");
    const auto chip = bench.Make<GIteChip>(kLed);
    bool wentOn = false;
    bench.EndAfter(step, [&] {
      chip->SavePowerLedState();
      platform::TheHost().clock.Sleep(1);
      wentOn = true;
    });
    EXPECT_FALSE(wentOn) << step;
    EXPECT_THAT(bench.machine.HardwareState(), ::testing::HasSubstr("configuration mode = closed")) << step;
  }
}

// ---- set-up

TEST(SuperIoChips, ABaseAddressIsTheFilesOrThePartsOrNone) {
  const std::string hwm = kEnter + "002E<-07 002F<-04 002E<-60 002F->0A 002E<-61 002F->10 " + kExit;
  const std::string gpio = kEnter + "002E<-07 002F<-07 002E<-62 002F->0A 002E<-63 002F->20 " + kExit;
  struct BaseCase {
    const char* text;
    std::string traffic;  // of the set-up, and of reading environment register 1 and line 23
    const char* failure;
  };
  const BaseCase kCases[] = {
      {"", hwm + gpio + "0A15<-01 0A16->00 0A21->08 ", ""},
      {"hwmbar=undef\ngpiobar=0\n", "", ""},
      {"hwmbar=0xFFFF\ngpiobar=0xFFFF\n", "", ""},  // what an absent part answers
      {"config.data.port=0\n", "", ""},             // without ports no part is asked
      {"hwmbar=0x10A10\ngpiobar.bar.ldn=undef\n", "0A15<-01 0A16->00 ", ""},
      {"hwmbar.bar.reg=undef\ngpiobar.bar.ldn=4\ngpiobar.bar.reg=0x6461\n",
       kEnter + "002E<-07 002F<-04 002E<-64 002F->0B 002E<-61 002F->10 " + kExit + "0B11->FF ", ""},
      {"hwmbar.bar.ldn=7\n", kEnter + "002E<-07 002F<-07 002E<-60 002F->00 002E<-61 002F->00 " + kExit,
       "could not read HWMBAR from SIO"},
      {"gpiobar.bar.reg=0x6566\n", hwm + kEnter + "002E<-07 002F<-07 002E<-65 002F->00 002E<-66 002F->00 " + kExit,
       "could not read GPIOBAR from SIO"},
  };
  for (const BaseCase& c : kCases) {
    SuperIoBench bench("plain");
    const std::string traffic = bench.Traffic([&] {
      EXPECT_EQ(TextOf([&] {
                  const auto chip = bench.Make<GSioChip>(c.text + kPorts);
                  chip->ReadEnvRegister(1);
                  chip->ReadLine(23);
                }),
                c.failure);
    });
    std::vector<std::string> words;
    CDMUtil::Split(traffic, words, " ");
    std::string requests;
    for (const std::string& word : words) {
      requests += word.ends_with("ms") ? "" : word + " ";  // the files take time, too
    }
    EXPECT_EQ(requests, c.traffic) << c.text;
  }
}

TEST(SuperIoChips, AListThatCannotBeUsedIsNamed) {
  const auto ite = [](const std::string& text) {
    return TextOf([&] { SuperIoBench("ite").Make<GIteChip>(kBases + text); });
  };
  const auto fintek = [](const std::string& text) {
    return TextOf([&] { SuperIoBench("plain").Make<GFintekChip>(kBases + text); });
  };
  const std::string green = "powerled.green.blink.sequence=";
  const std::string red = "powerled.red.blink.sequence=";
  EXPECT_EQ(ite("powerled.color.primary.gpio=18\n" + green + "1:2,secondary_led:3,x\n" + red + "undef\n"), "");
  EXPECT_EQ(ite("powerled.color.primary.gpio=18\n" + green + "1:primary_led\n"),
            "invalid primary led map. Check powerled.color.primary.gpio entry.");
  EXPECT_EQ(ite("powerled.color.secondary.gpio=undef\n" + red + "1:secondary_led\n"),
            "invalid secondary led map. Check powerled.color.secondary.gpio entry.");
  EXPECT_EQ(ite(green + "1:x\n" + red + "1:2E\n"), "invalid powerled.red.blink.sequence entry");
  EXPECT_EQ(ite(green + "1:Primary_led\n"), "invalid powerled.green.blink.sequence entry");
  EXPECT_EQ(fintek("fan.manual_mode.set.sequence=1:x 2:3\n" + red + "undef\n"), "");
  EXPECT_EQ(fintek("fan.manual_mode.set.sequence=1:2:3\n" + red + "1\n"),
            "malformed sequence entry: '1:2:3'. should be: 'cmd:data[.data]*,...'");
  EXPECT_EQ(fintek(green + "1:2,0xF8\n" + red + "X\n"),
            "malformed sequence entry: 'X'. should be: 'cmd:data[.data]*,...'");
}

// ---- fans, temperatures and lines

const std::string kFans =
    kLed +
    "fan.save.regs=0,0x13,0x14\nfan.restore_sleep=40\nfan.1.tach.reg=0x180D\nfan.1.pwm.reg=0x63\n"
    "fan.full_speed.data=0x7F\ntemp.1.read.reg=0x29\ntemp.1.limit.reg=0x180D\nfan.1.pwm_ctl.reg=0x15\n"
    "fan.2.pwm_ctl.reg=0x16\nfan.3.pwm_ctl.reg=0x17\nfan_main_control.reg=0x13\nfan_ctl.reg=0x14\n"
    "fan_ramp_rate.reg=0x6C\nconfig.reg=0\nfan.manual_mode.set.sequence=0x96:0x15,0x94:6\n";
const std::string kEnvironment =
    "settings = {00 = 0x10, 13 = 0x07, 14 = 0x1F, 15 = 0x81, 16 = 0x42, 17 = 0x03, 6C = 0xFF}\n"
    "sensors = {0D = 0x35, 18 = 0x01, 29 = 0x2A}\n";
const std::string kTach = "0A15<-18 0A16->01 0A15<-0D 0A16->35 ";
const std::string kSaved = "0A15<-00 0A16->10 0A15<-13 0A16->07 0A15<-14 0A16->1F ";

TEST(SuperIoChips, FansAndLinesAreTheirRegistersInOrder) {
  int value = 0;
  bool open = false;
  const auto rpm = [&](Chip& chip) { return chip.ReadFanRpm(1, value, 2) ? value : -1; };
  const auto full = [](Chip& chip) { return chip.SetFanFullSpeed(0); };
  const auto intrusion = [](Chip& chip) { return chip.ReadLine(237); };
  Expect<GSioChip>(
      SuperIoBench("plain", kEnvironment), kFans,
      {{rpm, 2 * 1350000 / (0x135 * 2), kTach},
       {[](Chip& chip) { return chip.TachToRpm(0xFFFE, 2) * 100 + chip.TachToRpm(0xFFFF, 2); }, 2000, ""},
       {[](Chip& chip) { return chip.TachToRpm(0, 2) + chip.TachToRpm(0x10000, 2); }, 0, ""},
       {full, 1, kSaved + "0A15<-63 0A16<-7F "},
       {[](Chip& chip) { return chip.SetFanPwm(1, 300) && chip.SetFanPwm(1, -1) && chip.SetFanPwmPercent(1, 50); }, 1,
        "0A15<-63 0A16<-7F 0A15<-63 0A16<-00 0A15<-63 0A16<-3F "},
       {&Chip::RestoreFanState, 1, "0A15<-14 0A16<-1F 0A15<-13 0A16<-07 0A15<-00 0A16<-10 40ms "},
       {&Chip::RestoreFanState, 1, ""},
       {[&](Chip& chip) { return chip.ReadTemperature(1, value) ? value : -1; }, 0x2A, "0A15<-29 0A16->2A "},
       {[&](Chip& chip) { return chip.ReadLowLimitTemperature(1, value) ? value : -1; }, 0x135, kTach},
       {[](Chip& chip) { return chip.MapTemperature(125) * 1000 + chip.MapTemperature(126); }, 125255, ""},
       {[](Chip& chip) { return chip.ReadLine(23) * 10 + chip.ReadLine(14); }, 34, "0A21->08 0A20->00 "}});
  const std::string opened =
      "[chip.environment.intrusion]\nstatus = 1\nstatus_bit = 4\nclear = 0\nclear_bit = 5\nis_open = true\n";
  const std::string id = kEnter + "002E<-20 002F->87 002E<-21 002F->20 002E<-22 002F->";
  Expect<GIteChip>(
      SuperIoBench("ite", kEnvironment + opened), kFans,
      {{full, 1,
        kSaved + id + "02 " + kIteExit +
            "0A15<-15 0A16->81 0A15<-15 0A16<-01 0A15<-16 0A16->42 0A15<-16 0A16<-02 0A15<-17 0A16->03 "
            "0A15<-63 0A16<-7F "},
       {intrusion, 3,
        "0A15<-00 0A16->10 0A15<-00 0A16<-30 0A15<-01 0A16->00 10ms 0A15<-01 0A16->00 100ms 0A15<-01 0A16->10 "},
       {[](Chip& chip) { return chip.ReadLine(23); }, -1, ""},
       {[](Chip& chip) {  // the register's other bits stay
          dynamic_cast<GIteChip&>(chip).ExitConfigMode();
          return 0;
        },
        0, "002E<-02 002F->FF 002F<-FF "}});
  Expect<GIteChip>(SuperIoBench("ite", kEnvironment, "0x05"), kFans,
                   {{full, 1, kSaved + id + "05 " + kIteExit + "0A15<-63 0A16<-7F "}});
  Expect<GIt8702Chip>(
      SuperIoBench("ite", kEnvironment), kFans,
      {{full, 1,
        kSaved + "0A15<-13 0A16->07 0A15<-13 0A16<-77 0A15<-14 0A16->1F 0A15<-14 0A16<-17 "
                 "0A15<-6C 0A16->FF 0A15<-6C 0A16<-3F 0A15<-00 0A16->10 0A15<-00 0A16<-10 0A15<-63 0A16<-3F "},
       {&Chip::RestoreFanState, 1, "0A15<-14 0A16<-1F 0A15<-13 0A16<-07 0A15<-00 0A16<-11 40ms "}});
  const std::string latched = "[chip.environment.intrusion]\nstatus = 3\nstatus_bit = 0\nwas_opened = true\n";
  const std::string line44 = kEnterLed + "002E<-B2 002F->10 " + kExit;
  Expect<GFintekChip>(SuperIoBench("plain", kEnvironment + latched), kFans,
                      {{rpm, 1500000 / 0x135, kTach},
                       {full, 1, kSaved + "0A15<-96 0A16<-15 0A15<-94 0A16<-06 0A15<-63 0A16<-7F "},
                       {intrusion, 4, "0A15<-03 0A16->01 0A15<-03 0A16<-01 10ms 0A15<-03 0A16->00 "},
                       {intrusion, 4, "0A15<-03 0A16->00 10ms 0A15<-03 0A16->00 "},
                       {[&](Chip& chip) { return chip.ReadIntrusionLatch(44, true, open) && open; }, 1, line44},
                       {[&](Chip& chip) { return chip.ReadIntrusionLatch(45, true, open) && !open; }, 1, line44},
                       {[&](Chip& chip) { return chip.ReadIntrusionLatch(46, true, open); }, 0, ""}});
  SuperIoBench bench("plain");
  const auto chip = bench.Make<GFintekChip>(kBases);
  std::string lines;
  for (const int line : {5, 4, 17, 10, 20, 27, 33, 30, 6, 9, 18, 28, 34, 46, -1, 50}) {
    lines += std::to_string(chip->ReadLine(line)) + " ";
  }
  EXPECT_EQ(lines, "3 4 3 4 3 4 3 4 -1 -1 -1 -1 -1 -1 -1 -1 ");
  EXPECT_EQ(chip->TachToRpm(4095, 1) + chip->TachToRpm(0xFFFF, 1) + chip->TachToRpm(0, 1), 0);
}

TEST(SuperIoChips, NumbersOutOfRangeAndSavedStateThatDoesNotFitAreNamed) {
  SuperIoBench bench("plain", kEnvironment);
  const auto sio = bench.Make<GSioChip>(kFans);
  int value = 0;
  const std::pair<std::function<void()>, const char*> kCases[] = {
      {[&] { sio->ReadFanTach(2, 0); }, "read fan tach: invalid fan index 2 (must be 1..1 +1)"},
      {[&] { sio->SetFanPwm(0, 1); }, "set fan PWM: invalid pwm index 0 (must be 1..1)"},
      {[&] { sio->ReadTemperature(-1, value); }, "read temperature: invalid zone -1 (must be 1..1 +1)"},
      {[&] { sio->ReadLowLimitTemperature(0, value); },
       "read low limit temperature: invalid zone 0 (must be 1..1 +1)"},
  };
  for (const auto& [action, says] : kCases) {
    EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(TextOf(action), says); }), "") << says;
  }
  // The lists are read anew between a save and its restore.
  sio->SaveFanState();
  sio->SavePowerLedState();
  bench.SetChipText("g_sio", "fan.save.regs=0x15\npowerled.state.regs=0xF8\n");
  sio->LoadFanConfiguration();
  sio->LoadPowerLedConfiguration();
  EXPECT_EQ(TextOf([&] { sio->RestoreFanState(); }),
            "fan state restore integrity check failed: fan reg list size (1) differs from saved data list size (3)");
  EXPECT_EQ(TextOf([&] { sio->RestorePowerLedState(); }),
            "power LED state restore inegrity check: power led state reg list size (1) differs from saved data list "
            "size (2)");
  const auto it8702 = bench.Make<GIt8702Chip>(kFans);
  it8702->SaveFanState();
  bench.SetChipText("g_it8702", "");
  it8702->LoadFanConfiguration();
  EXPECT_EQ(TextOf([&] { it8702->RestoreFanState(); }),
            "restore fan state integrity check: saved fan reg list size (0) differs from saved data list size (3)");
}

}  // namespace
}  // namespace panelglow
