// What the embedded controllers and the mailbox do on their ports for each operation, and what they give back when
// the part hangs.
#include <gmock/gmock.h>

#include <functional>

#include "board/ChipCases.h"
#include "board/base/mblib_exception.h"
#include "board/chips/ec/EcIt8512Chip.h"
#include "board/chips/ec/EcIt8518Chip.h"
#include "board/chips/ec/EcWpc8763Chip.h"
#include "board/chips/ec/SmscKbc1126Chip.h"
#include "board/chips/ec/SmscMec1322Chip.h"
#include "board/chips/generic/GEcIt8519Chip.h"

namespace panelglow {
namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;
using ::testing::ThrowsMessage;
using Operation = bool (Chip::*)();

// A controller that always has room for a byte and always has an answer, 0x2A.
constexpr const char* kReady =
    "chip = [{name = \"s\", kind = \"gpio-block\", base = 0x65, outputs = 0, inputs = 0x01},\n"
    "{name = \"d\", kind = \"gpio-block\", base = 0x61, outputs = 0, inputs = 0x2A}]\n";

std::string Controller(const std::string& more) {
  return "chip = [{name = \"ec\", kind = \"embedded-controller\", take_us = 0, answer_us = 0" + more + "}]\n";
}

// Traffic on the ports 0x66 and 0x62, with "?" for a look at the status and "?*4096" for so many in a row.
std::string Terse(const std::string& traffic) {
  std::vector<std::string> words;
  CDMUtil::Split(traffic, words, " ");
  std::string text;
  std::size_t looks = 0;
  for (const std::string& word : words) {
    const bool isLook = word.rfind("0066->", 0) == 0;
    if (!isLook && looks > 0) {
      text += looks == 1 ? "? " : "?*" + std::to_string(looks) + " ";
    }
    looks = isLook ? looks + 1 : 0;
    text += isLook ? "" : word.substr(word.rfind("006", 0) == 0 ? 2 : 0) + " ";
  }
  return text + (looks == 0 ? "" : "?*" + std::to_string(looks) + " ");
}

class ChipBench : public KeyBench {
 public:
  using KeyBench::KeyBench;
  std::string Ec(const std::function<void()>& action) { return Terse(Traffic(action)); }
};

TEST(EcChips, ThePowerLampIsTheClassesOwnCommandsEachByteBehindAWait) {
  ChipBench bench(kReady);
  EcChip ec;
  EcWpc8763Chip wpc;
  EcIt8512Chip it8512;
  EcIt8518Chip it8518;
  SmscKbc1126Chip kbc;
  const char* const kEcGreen = "? 66<-8E ? 62<-03 ? 66<-EE ? 62<-00 ";
  const char* const kEcRed = "? 66<-8E ? 62<-04 ? 66<-EE ? 62<-00 ";
  const char* const kEcOff = "? 66<-8E ? 62<-00 ? 66<-EE ? 62<-00 ";
  const char* const kEcRestore = "? 66<-8E ? 62<-05 ? 66<-EE ? 62<-01 ";
  const char* const kA2Green = "? 66<-A2 ? 62<-02 ? 66<-EE ? 62<-00 ";
  const char* const kKbcGreen = "?*2 66<-81 ? 62<-3D ? 62<-F3 ";
  struct Case {
    Chip& chip;
    const char* green;
    const char* red;
    const char* off;
    const char* restore;
  };
  const Case kCases[] = {
      {ec, kEcGreen, kEcRed, kEcOff, kEcRestore},
      {wpc, kEcGreen, kEcRed, kEcOff, kEcRestore},
      {it8512, "? 66<-C0 ", "? 66<-C2 ", "? 66<-C1 ? 66<-C3 ", "? 66<-C0 "},
      {it8518, kA2Green, "? 66<-A2 ? 62<-01 ? 66<-EE ? 62<-00 ", "? 66<-A2 ? 62<-00 ? 66<-EE ? 62<-00 ", kA2Green},
      {kbc, kKbcGreen, kEcRed, "?*2 66<-81 ? 62<-3D ? 62<-F0 ", kKbcGreen},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.chip.GetName());
    EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(c.chip.SavePowerLedState()); }), "");
    EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(c.chip.AssertPowerLedGreen()); }), c.green);
    EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(c.chip.AssertPowerLedRed()); }), c.red);
    EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(c.chip.DeassertPowerLed()); }), c.off);
    EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(c.chip.RestorePowerLedState()); }), c.restore);
    bool red = false;
    EXPECT_FALSE(c.chip.IsPowerLedRedSupported(red) || c.chip.BlinkPowerLedGreen() || c.chip.BlinkPowerLedRed());
  }
}

TEST(EcChips, FansAndSensorsAreReadAndSetByTheClassesOwnAddresses) {
  ChipBench bench(kReady);
  EcChip ec;
  EcWpc8763Chip wpc;
  EcIt8512Chip it8512;
  EcIt8518Chip it8518;
  SmscKbc1126Chip kbc;
  int value = 0;
  const auto tach = [&](Chip& chip, int fan) {
    const std::string traffic = bench.Traffic([&] { value = static_cast<int>(chip.ReadFanTach(fan, 0)); });
    return Terse(traffic) + std::to_string(value);
  };
  const auto degrees = [&](Chip& chip, int zone) {
    bool known = false;
    const std::string traffic = bench.Traffic([&] { known = chip.ReadTemperature(zone, value); });
    return Terse(traffic) + (known ? "" : "no ") + std::to_string(value);
  };
  const auto read = [](const std::string& address) {
    return "? 66<-80 ? 62<-" + address + " ? 62->2A ";  // six requests, when the controller is ready
  };
  const std::string manual = "?*2 66<-C1 ? 62<-04 ? 62<-61 ? 62<-04 ";
  EXPECT_EQ(tach(ec, 1), read("66") + read("67") + "?*2 66<-C1 ? 62<-04 ? 62<-61 ? 62<-00 10794");
  EXPECT_EQ(tach(ec, 3), "65535");
  EXPECT_EQ(tach(wpc, 2), read("B5") + "42");
  EXPECT_EQ(tach(wpc, 0), "255");
  EXPECT_EQ(tach(it8512, 2), read("8A") + read("8B") + "? 66<-71 ? 62<-01 ? 66<-71 ? 62<-02 10794");
  EXPECT_EQ(tach(it8518, 1), read("54") + read("53") + "10794");
  EXPECT_EQ(tach(it8518, 2), "65535");
  EXPECT_EQ(tach(kbc, 2), "?*2 66<-80 ? 62<-3A ?*2 62->2A 42");
  EXPECT_EQ(tach(kbc, 3), "255");
  EXPECT_EQ(degrees(ec, 1), read("58") + "42");
  EXPECT_EQ(degrees(ec, 2), "no 255");
  EXPECT_EQ(degrees(it8512, 2), read("94") + "42");
  EXPECT_EQ(degrees(it8518, 2), read("41") + "42");
  EXPECT_EQ(degrees(kbc, 3), "?*2 66<-81 ? 62<-22 ? 62<-03 ?*2 66<-80 ? 62<-26 ?*2 62->2A 42");
  EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(ec.SetFanPwm(1, 0x180) && !ec.SetFanPwm(3, 7)); }),
            manual + "?*2 66<-C1 ? 62<-04 ? 62<-57 ? 62<-80 ");
  EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(it8518.SetFanPwm(2, 7)); }),
            manual + "?*2 66<-C1 ? 62<-04 ? 62<-DE ? 62<-07 ");
  EXPECT_EQ(bench.Ec([&] { it8512.SetFanFullSpeed(2); }),
            "? 66<-70 ? 62<-01 ? 66<-70 ? 62<-02 ? 66<-9B ? 62<-18 ? 62<-05 ? 62<-F0 ");
  EXPECT_EQ(bench.Ec([&] {
    kbc.SetFanPwmPercent(1, 25);
    kbc.SetFanFullSpeed(2);
    EXPECT_TRUE(kbc.SetManualFanMode(false) && kbc.SetManualFanMode(true) && kbc.SetManualFanMode(false));
  }),
            "?*2 66<-81 ? 62<-2F ? 62<-BF ?*2 66<-81 ? 62<-3A ? 62<-01 "
            "?*2 66<-81 ? 62<-2F ? 62<-FF ?*2 66<-81 ? 62<-3A ? 62<-00 ");
  EXPECT_EQ(kbc.TachToRpm(42, 1), 5851);
  EXPECT_TRUE(kbc.ReadFanRpmRaw(2, value, 1) && value == 5849);
  EXPECT_EQ(wpc.TachToRpm(42, 2), 16071);
  EXPECT_EQ(wpc.TachToRpm(0, 2) + wpc.TachToRpm(42, 0), 0);
  EXPECT_EQ(ec.TachToRpm(0xFFFE, 1), 32);
  EXPECT_EQ(ec.TachToRpm(0xFFFF, 1), 0);
  // 0x2A: bits 1, 3 and 5 are set.
  EXPECT_EQ(bench.Ec([&] { EXPECT_EQ(it8518.ReadLineByNames(0x21, "0x3", "2"), Chip::kAsserted); }),
            read("21") + "66<-21 62<-2E 10ms 66<-21 62<-2A " + read("21"));
  EXPECT_EQ(it8518.ReadLineByNames(0x21, "2", ""), Chip::kNotAsserted);
}

TEST(EcChips, ATachometersHighByteIsWhereTheClassHasIt) {
  ChipBench bench(Controller(", memory = {\"66\" = 2, \"67\" = 1, \"88\" = 4, \"89\" = 3, \"54\" = 6, \"53\" = 5}"));
  EXPECT_EQ(EcChip().ReadFanTach(1, 0), 0x0102U);
  EXPECT_EQ(EcIt8512Chip().ReadFanTach(1, 0), 0x0304U);
  EXPECT_EQ(EcIt8518Chip().ReadFanTach(1, 0), 0x0506U);
}

TEST(SmscKbc1126Chip, TheRunningAverageDropsTheLowestAndTheHighestOfTenSamples) {
  ChipBench bench(Controller(", memory = {\"3A\" = 0x10}"), "chip.smsc_kbc1126.runningaverage=true\n", "");
  SmscKbc1126Chip chip;
  const platform::sim::Microseconds began = bench.machine.Time().Now();
  for (const auto& [at_ms, value] : {std::pair{500U, 0x20U}, {8500U, 0xFFU}}) {
    bench.machine.Time().At(began + at_ms * 1000, [&bench, changed = value] {
      bench.machine.Hardware().WritePort(0x66, 1, 0x81);
      bench.machine.Hardware().WritePort(0x62, 1, 0x3A);
      bench.machine.Hardware().WritePort(0x62, 1, changed);
    });
  }
  EXPECT_EQ(chip.ReadFanTach(2, 0), 0x20U);
  EXPECT_EQ((bench.machine.Time().Now() - began) / 1'000'000, 10U);
  EXPECT_THAT(bench.machine.Output(), HasSubstr("LogMessage 6 20000 \"Fan Tach for fan index: 2 = 0xff "));
}

TEST(SmscKbc1126Chip, AZoneWithoutSensorReads255) {
  for (const auto& [answer, zone, degrees] :
       {std::tuple{"0x00", 1, 255}, {"0x55", 2, 255}, {"0x55", 3, 0x55}, {"0x14", 5, 255}, {"0x14", 2, 0x14}}) {
    ChipBench bench(Controller(std::string(", memory = {\"26\" = ") + answer + "}"));
    int value = 0;
    EXPECT_TRUE(SmscKbc1126Chip().ReadTemperature(zone, value));
    EXPECT_EQ(value, degrees) << answer << zone;
  }
}

// ---- the generic embedded controller

constexpr const char* kGenericEc =
    "[g_ec]\nec.set_pwm.cmd=0x44\npowerled.red.assert.sequence=0x1A2:0x01.0x03,0xEE:undef\n"
    "powerled.green.assert.sequence=0xA2:2\npowerled.deassert.sequence=0xC1:undef,0xC3:undef\n"
    "powerled.state.save.sequence=undef\npowerled.state.restore.sequence=0xEE:1\n"
    "fan.manual_mode.set.sequence=0x70:1\nfan.manual_mode.reset.sequence=0x71:1\n"
    "fan.1.tach.reg=0x0150\nfan.2.tach.reg=0x12345678\nfan.full_speed.data=200\n"
    "temp.1.read.reg=0xFF\ntemp.2.read.reg=0x100\ntemp.1.limit.reg=0x134\n[g_ec_it8519]\nbase=g_ec\n";

std::unique_ptr<GEcChip> GenericEc(ChipBench& bench, const std::string& settings = "") {
  bench.Use(settings, kGenericEc);
  auto chip = std::make_unique<GEcChip>();
  chip->Initialize();
  return chip;
}

TEST(GEcChip, EachOperationIsItsSequenceBehindOneWaitForTheOutputBuffer) {
  ChipBench bench(kReady);
  const std::unique_ptr<GEcChip> ec = GenericEc(bench);
  const std::pair<Operation, const char*> kOperations[] = {
      {&Chip::SavePowerLedState, ""},
      {&Chip::AssertPowerLedGreen, "?*2 66<-A2 ? 62<-02 "},
      {&Chip::AssertPowerLedRed, "?*2 66<-A2 ? 62<-01 ? 62<-03 ? 66<-EE "},
      {&Chip::DeassertPowerLed, "?*2 66<-C1 ? 66<-C3 "},
      {&Chip::RestorePowerLedState, "?*2 66<-EE ? 62<-01 "},
  };
  for (const auto& [operation, wanted] : kOperations) {
    EXPECT_EQ(bench.Ec([&, run = operation] { EXPECT_TRUE(((*ec).*run)()); }), wanted);
  }
  bool red = false;
  EXPECT_TRUE(ec->IsPowerLedRedSupported(red) && red);
  EXPECT_FALSE(ec->BlinkPowerLedGreen() || ec->BlinkPowerLedRed());
  EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(ec->SetManualFanMode(true) && ec->SetManualFanMode(false)); }),
            "?*2 66<-70 ? 62<-01 ?*2 66<-71 ? 62<-01 ");
  const auto slow = GenericEc(bench, "chip.g_ec.ec.ibf.sleeptime=3\nchip.g_ec.ec.obf.sleeptime=20\n");
  EXPECT_EQ(bench.Ec([&] { slow->AssertPowerLedGreen(); }), "20ms ? 3ms ? 66<-A2 3ms ? 62<-02 ");
}

TEST(GEcChip, FansAndSensorsGoByTheRegistersOfTheFile) {
  ChipBench bench(kReady);
  const std::unique_ptr<GEcChip> ec = GenericEc(bench);
  int value = 0;
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(ec->ReadEc(0x10), 0x2A); }),
            "0066->01 0066<-80 0066->01 0062<-10 0066->01 0062->2A ");
  EXPECT_EQ(bench.Ec([&] { EXPECT_EQ(ec->ReadFanTach(1, 0), 0x2A2AU); }),
            "? 66<-80 ? 62<-01 ? 62->2A ? 66<-80 ? 62<-50 ? 62->2A ");
  EXPECT_EQ(bench.Ec([&] { EXPECT_EQ(ec->ReadFanTach(2, 0), 0x2A2AU); }),
            "? 66<-80 ? 62<-12 ? 62<-34 ? 62->2A ? 66<-80 ? 62<-56 ? 62<-78 ? 62->2A ");
  EXPECT_EQ(bench.Ec([&] {
    for (const int zone : {1, 2}) {
      EXPECT_TRUE(ec->ReadTemperature(zone, value));
    }
    EXPECT_TRUE(ec->ReadLowLimitTemperature(1, value) && value == 0x2A);
  }),
            "? 66<-80 ? 62<-FF ? 62->2A ? 66<-80 ? 62<-01 ? 62<-00 ? 62->2A ? 66<-80 ? 62<-34 ? 62->2A ");
  EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(ec->SetFanPwm(5, 10) && ec->SetFanPwm(0, 201)); }),
            "?*2 66<-44 ? 62<-0A ?*2 66<-44 ? 62<-C8 ");
  const auto two = GenericEc(bench, "chip.g_ec.fan.1.pwm.reg=0x34\nchip.g_ec.fan.2.pwm.reg=0x134\n");
  EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(two->SetFanPwm(1, -1) && two->SetFanPwm(2, 1)); }),
            "?*2 66<-44 ? 62<-34 ? 62<-00 ?*2 66<-44 ? 62<-01 ? 62<-34 ? 62<-01 ");
  const std::pair<std::function<void()>, const char*> kOutOfRange[] = {
      {[&] { ec->ReadFanTach(3, 0); }, "read fan tach: invalid fan index 3 (must be 1..2 +1)"},
      {[&] { two->SetFanPwm(0, 1); }, "set fan PWM: invalid pwm index 0 (must be 1..2)"},
      {[&] { ec->ReadTemperature(3, value); }, "read temperature: invalid zone 3 (must be 1..2 +1)"},
      {[&] { ec->ReadLowLimitTemperature(2, value); },
       "read low limit temperature: invalid zone 2 (must be 1..1 +1)"},
      {[&] { GenericEc(bench, "chip.g_ec.ec.set_pwm.cmd=undef\n"); },
       "chip.ini missing mandatory entry for EC: ec.set_pwm.cmd"},
  };
  for (const auto& [action, text] : kOutOfRange) {
    EXPECT_THAT(action, ThrowsMessage<mblib_exception>(text));
  }
  EXPECT_EQ(ec->TachToRpm(1000, 1), 2156);
  EXPECT_EQ(ec->TachToRpm(0, 1) + ec->TachToRpm(0xFFFF, 1), 0);
  EXPECT_EQ(GEcIt8519Chip().TachToRpm(0xFFFE, 1), 0xFFFE);
  EXPECT_EQ(GEcIt8519Chip().TachToRpm(0xFFFF, 1), 0);
}

TEST(EcChips, AHangingControllerIsGivenUpAfterItsLooksAndTheOperationGoesOn) {
  struct Case {
    const char* fault;
    const char* read;   // of the generic class, which looks 4095 times
    const char* green;  // of an older one, which looks 4096 times
    int answer;
    unsigned requests;
  };
  const Case kCases[] = {
      {"", "? 66<-80 ? 62<-10 ? 62->07 ", "?*4097 66<-81 ? 62<-3D ? 62<-F3 ", 7, 6 + 4102},
      {", fault = \"stuck-obf\"", "? 66<-80 ? 62<-10 ?*4095 62->00 ", "?*4097 66<-81 ? 62<-3D ? 62<-F3 ", 0,
       4100 + 4102},
      {", fault = \"stuck-ibf\"", "?*4095 66<-80 ?*4095 62<-10 ?*4095 62->00 ",
       "?*8192 66<-81 ?*4096 62<-3D ?*4096 62<-F3 ", 0, 12288 + 16387},
  };
  for (const Case& c : kCases) {
    ChipBench bench(Controller(c.fault + std::string(", memory = {\"10\" = 7}")));
    const std::unique_ptr<GEcChip> chip = GenericEc(bench);
    SmscKbc1126Chip older;
    if (c.requests > 20'000) {
      bench.machine.Hardware().WritePort(0x66, 1, 0);  // what the firmware hangs on
    }
    constexpr unsigned kRequest_us = 2;
    const platform::sim::Microseconds began = bench.machine.Time().Now();
    EXPECT_EQ(bench.Ec([&] { EXPECT_EQ(chip->ReadEc(0x10), c.answer); }), c.read);
    EXPECT_EQ(bench.Ec([&] { EXPECT_TRUE(older.AssertPowerLedGreen()); }), c.green);
    EXPECT_EQ(bench.machine.Time().Now() - began, c.requests * kRequest_us);
  }
}

// ---- the mailbox

constexpr const char* kMailbox =
    "chip = [{name = \"m\", kind = \"mailbox-controller\", step_us = 0, configuration_port = 0x4E,"
    " memory = {\"10\" = 0x5C, \"20\" = 0x3D, \"4000A002\" = 0xA5, \"4000A00F\" = 0x2C}}]\n";

constexpr const char* kMailboxRead = "0200<-82 0201<-01 50ms 0200<-86 0201->";  // then the byte and 50 ms
constexpr const char* kMailboxWritten = " 50ms 0200<-82 0201<-02 50ms ";        // behind the byte

TEST(SmscMec1322Chip, LampsAreListsOfPortsAndTheirMultiplexersGoThroughTheMailbox) {
  ChipBench bench(
      kMailbox, "chip.smsc_mec1322.data=box\ntest.panelglow.waittime=7\n",
      "[box]\npowerled.green.assert.sequence=0xA0:1,0xA1:2\npowerled.green.deassert.sequence=0xA0:0\n"
      "powerled.green.savemux.sequence=0x200:0x84,0x201:0x10\npowerled.green.enablemux.sequence=0xB1:4\n"
      "chargeled.green.assert.sequence=0xC0:1\nchargeled.green.deassert.sequence=0xC0:0\n"
      "chargeled.green.savemux.sequence=0x200:0x84,0x201:0x10\nchargeled.green.enablemux.sequence=0xC1:5\n"
      "chargeled.red.assert.sequence=0xD0:1\nchargeled.red.deassert.sequence=undef\n"
      "chargeled.red.savemux.sequence=0x200:0x84,0x201:0x20\nchargeled.red.enablemux.sequence=0xD1:6\n");
  std::unique_ptr<SmscMec1322Chip> chip;
  EXPECT_THAT(bench.Traffic([&] { chip = std::make_unique<SmscMec1322Chip>(); }),
              StartsWith("002E<-55 002F->FF 004E<-55 "));
  const std::string at10 = "0200<-84 7ms 0201<-10 7ms ";
  const std::string at20 = "0200<-84 7ms 0201<-20 7ms ";
  const std::string read = kMailboxRead;
  const std::string write = "0200<-86 0201<-";
  const std::string written = kMailboxWritten;
  const std::tuple<Operation, bool, std::string> kOperations[] = {
      {&Chip::RestorePowerLedState, true, ""},  // nothing is saved yet
      {&Chip::RestoreChargeLedState, true, ""},
      {&Chip::SavePowerLedState, true, at10 + read + "5C 50ms 00B1<-04 7ms "},
      {&Chip::AssertPowerLedGreen, true, "00A0<-01 7ms 00A1<-02 7ms "},
      {&Chip::DeassertPowerLed, true, "00A0<-00 7ms "},
      {&Chip::RestorePowerLedState, true, at10 + write + "5C" + written + "00A0<-01 7ms 00A1<-02 7ms "},
      {&Chip::SaveChargeLedState, true,
       at20 + read + "3D 50ms 00D1<-06 7ms " + at10 + read + "5C 50ms 00C1<-05 7ms "},
      {&Chip::AssertChargeLedWhite, true, "00C0<-01 7ms "},
      {&Chip::DeassertChargeLedWhite, true, "00C0<-00 7ms "},
      {&Chip::AssertChargeLedRed, true, "00D0<-01 7ms "},
      {&Chip::DeassertChargeLedRed, false, ""},
      {&Chip::RestoreChargeLedState, true, at10 + write + "5C" + written + at20 + write + "3D" + written},
  };
  for (const auto& [operation, done, traffic] : kOperations) {
    EXPECT_EQ(bench.Traffic([&, run = operation, wanted = done] { EXPECT_EQ((*chip.*run)(), wanted); }), traffic);
  }
}

TEST(SmscMec1322Chip, AMultiplexerThatNoListReachesIsNotPutBack) {
  ChipBench bench(kMailbox, "",
                  "[smsc_mec1322]\npowerled.green.assert.sequence=0xA0:1\nchargeled.red.enablemux.sequence=0xD1:6\n");
  SmscMec1322Chip chip;
  const std::tuple<Operation, const char*> kOperations[] = {{&Chip::SavePowerLedState, ""},
                                                            {&Chip::RestorePowerLedState, "00A0<-01 30ms "},
                                                            {&Chip::SaveChargeLedState, "00D1<-06 30ms "},
                                                            {&Chip::RestoreChargeLedState, ""}};
  for (const auto& [operation, traffic] : kOperations) {
    EXPECT_EQ(bench.Traffic([&, run = operation] { EXPECT_TRUE((chip.*run)()); }), traffic);
  }
}

TEST(SmscMec1322Chip, TheFanIsBehindAPageOfTheMailbox) {
  const auto at = [](const std::string& low) {
    return "0200<-85 0201<-40 50ms 0200<-84 0201<-00 50ms 0200<-82 0201<-1D 50ms "
           "0200<-85 0201<-A0 50ms 0200<-84 0201<-" +
           low + " 50ms ";
  };
  const std::string read = kMailboxRead;
  const std::string written = kMailboxWritten;
  ChipBench bench(kMailbox);
  SmscMec1322Chip chip;
  EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(chip.ReadFanTach(1, 0), 0x2CU); }), at("0F") + read + "2C 50ms ");
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.SetFanPwm(1, 0x80) && !chip.SetFanPwm(2, 0x80)); }),
            at("02") + read + "A5 50ms " + at("02") + "0200<-86 0201<-25" + written + at("00") + "0200<-86 0201<-80" +
                written);
  EXPECT_EQ(bench.Traffic([&] { EXPECT_TRUE(chip.SetManualFanMode(false) && chip.SetManualFanMode(false)); }),
            at("02") + read + "25 50ms " + at("02") + "0200<-86 0201<-A5" + written);
  EXPECT_EQ(chip.TachToRpm(0x2C, 1), 2792);
}

TEST(SmscMec1322Chip, AHangingMailboxIsAskedElevenTimesAndAMalformedListIsRefused) {
  ChipBench bench(
      "chip = [{name = \"m\", kind = \"mailbox-controller\", fault = \"stuck-busy\"},\n"
      "{name = \"c\", kind = \"gpio-block\", base = 0x2E, outputs = 0, inputs = 0x00}]\n");
  std::unique_ptr<SmscMec1322Chip> chip;
  EXPECT_THAT(bench.Traffic([&] { chip = std::make_unique<SmscMec1322Chip>(); }),
              StartsWith("002E<-55 002F->00 002E<-55 "));
  const platform::sim::Microseconds began = bench.machine.Time().Now();
  EXPECT_EQ(chip->ReadFanTach(1, 0), 0x48U);
  EXPECT_EQ((bench.machine.Time().Now() - began) / 1000, 11U * 350);
  bench.Use("", "[smsc_mec1322]\nchargeled.red.savemux.sequence=0xA5D\n");
  EXPECT_THAT([] { SmscMec1322Chip(); },
              ThrowsMessage<mblib_exception>("malformed sequence entry: '0xA5D'. should be: 'cmd:data[.data]*,...'"));
}

}  // namespace
}  // namespace panelglow
