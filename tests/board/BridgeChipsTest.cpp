// What the southbridges and the devices behind them do on the ports and in memory, request by request.
#include <gtest/gtest.h>

#include <limits>

#include "board/AnsweringBench.h"
#include "board/chips/southbridge/HudsonChip.h"
#include "board/chips/southbridge/IntelC200Chip.h"
#include "board/chips/southbridge/McpChip.h"
#include "board/chips/southbridge/Sb710Chip.h"

namespace panelglow {
namespace {

constexpr int kLargest = std::numeric_limits<int>::max();
constexpr int kSmallest = std::numeric_limits<int>::min();

std::function<int(Chip&)> Named(std::uint32_t offset, const char* bit, const char* clear = "") {
  return [=](Chip& chip) { return chip.ReadLineByNames(offset, bit, clear); };
}
// The latch's value, or -1 where it cannot be read.
std::function<int(Chip&)> Latch(int line, bool clearFirst) {
  return [=](Chip& chip) {
    bool value = false;
    return chip.ReadIntrusionLatch(line, clearFirst, value) ? int{value} : -1;
  };
}

// ---- "ich"

Answers IchPorts() {
  return {{0xFA0C, {0x01}}, {0xFA0D, {0x00}}, {0xFA0E, {0x00}}, {0xFA0F, {0x80}}, {0xFA38, {0x00}}, {0xFA39, {0x00}},
          {0xFA3A, {0x00}}, {0xFA3B, {0x80}}, {0xFA48, {0x01}}, {0xFA49, {0x00}}, {0xFA4A, {0x00}}, {0xFA4B, {0x00}},
          {0xF858, {0x5E}}, {0xF801, {0x01}}, {0xF802, {0x20}}, {0xF803, {0x01}}};
}

TEST(IchChip, LinesAreBitsOfThreeDwords) {
  AnsweringBench bench(IchPorts());
  IchChip chip;
  int value = 7;
  const auto activity = [&](int line) {
    return [&value, line](Chip& c) { return c.ReadLineActivity(line, value) ? 1 : 0; };
  };
  ExpectCases(bench, chip,
              {{Line(0), 3, "FA0C->80000001 "},
               {Line(1), 4, "FA0C->80000001 "},
               {Line(31), 3, "FA0C->80000001 "},
               {Line(32), 4, "FA38->80000000 "},
               {Line(63), 3, "FA38->80000000 "},
               {Line(64), 3, "FA48->00000001 "},
               {Line(95), 4, "FA48->00000001 "},
               {Line(96), -1, ""},
               {Line(240), -1, ""},
               {Line(-1), -1, ""},
               {Line(kLargest), -1, ""},
               {Line(kSmallest), -1, ""},
               {activity(96), 0, ""}});
  EXPECT_EQ(value, -1);
}

TEST(IchChip, TheHoodSwitchIsALatch) {
  const std::string read = "F866<-0001 10ms F866->";
  AnsweringBench bench(Answers{{0xF866, {0x03, 0x02, 0x01, 0x00, 0x01, 0x01, 0x00}}, {0xF867, {0x00}}});
  IchChip chip;
  const std::string pull = "1293<-FD 75ms F866<-0001 F866->";
  ExpectCases(bench, chip,
              {{Line(238), 3, read + "0003 "},
               {Line(238), 4, read + "0002 "},
               {Latch(238, true), 1, read + "0001 "},
               {Latch(12, true), -1, pull + "0000 "},
               {Latch(-1, true), 1, pull + "0001 1293<-FF 75ms F866<-0001 F866->0001 "},
               {Latch(-1, false), 0, "F866->0000 "},
               {Latch(96, true), -1, ""},
               {Latch(12, false), 1, "FA0C->FFFFFFFF "},
               {Latch(96, false), -1, ""}});
}

TEST(IchChip, ThePowerLedIsTwoLines) {
  AnsweringBench bench(IchPorts());
  IchChip chip;
  ExpectCases(bench, chip,
              {{Red, 1, ""},
               {&Chip::RestorePowerLedState, 1, ""},
               {&Chip::SavePowerLedState, 1, "FA0C->80000001 "},
               {&Chip::SavePowerLedState, 1, ""},
               {&Chip::AssertPowerLedGreen, 1, "FA0C->80000001 FA0C<-80001001 "},
               {&Chip::AssertPowerLedRed, 1, "FA0C->80001001 FA0C<-81001001 "},
               {&Chip::DeassertPowerLed, 1, "FA0C->81001001 FA0C<-80000001 "},
               {&Chip::RestorePowerLedState, 1, "FA0C<-80000001 "},
               {&Chip::RestorePowerLedState, 1, ""}});

  AnsweringBench two(IchPorts(), "test.powerled.gpio.primary=64\ntest.powerled.gpio.secondary=33\n");
  IchChip apart;
  ExpectCases(two, apart,
              {{&Chip::SavePowerLedState, 1, "FA48->00000001 FA38->80000000 "},
               {&Chip::AssertPowerLedRed, 1, "FA38->80000000 FA38<-80000002 "},
               {&Chip::DeassertPowerLed, 1, "FA48->00000001 FA48<-00000000 FA38->80000002 FA38<-80000000 "},
               {&Chip::RestorePowerLedState, 1, "FA48<-00000001 FA38<-80000000 "}});

  AnsweringBench none(IchPorts(), "test.powerled.gpio.secondary=96\n");
  IchChip unmapped;
  ExpectCases(none, unmapped,
              {{&Chip::SavePowerLedState, 0, "FA0C->80000001 "},
               {&Chip::AssertPowerLedRed, 0, ""},
               {&Chip::AssertPowerLedGreen, 1, "FA0C->80000001 FA0C<-80001001 "},
               {&Chip::DeassertPowerLed, 0, ""},
               {&Chip::RestorePowerLedState, 1, "FA0C<-80000001 "}});
}

TEST(IchChip, ThePowerButtonIsLatchedAndNotObeyedWhileArmed) {
  AnsweringBench bench(IchPorts());
  IchChip chip;
  ExpectCases(bench, chip,
              {{&Chip::SavePowerButtonState, 1, "F858->5E "},
               {&Chip::ArmPowerButton, 1, "F858<-5D F802->0120 F802<-0000 F801<-01 "},
               {Pressed, 1, "F801->01 "},
               {&Chip::SavePowerButtonState, 1, ""},
               {&Chip::ArmPowerButton, 1, "F858<-5D F802<-0000 F801<-01 "},
               {&Chip::RestorePowerButtonState, 1, "F801<-01 F802<-0120 F858<-5E "},
               {&Chip::RestorePowerButtonState, 1, ""}});

  AnsweringBench moved({},
                       "chip.ich.pmbar=0x400\nchip.ich.pm.enable.offset=6\nchip.ich.pm.status.offset=5\n"
                       "chip.ich.gpiobar=0x500\n");
  IchChip other;
  ExpectCases(moved, other,
              {{&Chip::SavePowerButtonState, 1, "0458->FF "},
               {&Chip::ArmPowerButton, 1, "0458<-FD 0406->FFFF 0406<-0000 0405<-01 "},
               {Line(2), 3, "050C->FFFFFFFF "}});

  AnsweringBench zero({}, "chip.ich.pmbar=0\nchip.ich.gpiobar=undef\n");
  IchChip byDefault;
  ExpectCases(zero, byDefault, {{&Chip::SavePowerButtonState, 1, "F858->FF "}, {Line(2), 3, "FA0C->FFFFFFFF "}});
}

// A network controller whose memory is at 0xF0000000.
constexpr const char* kController =
    "[[pci]]\ndevice = 3\n[pci.registers]\n\"0\" = 0x165314E4\n\"8\" = 0x02000000\n\"18\" = 0xF0000004\n"
    "\"2C\" = 0x3033103C\n";

// The line answers from a port.
TEST(IchChip, ADashCableIsALineThatFollowsTheControllersPin) {
  const char* const ids = "0x14E4 0x1653  0x103C 0x3033";
  const auto detect = [](int line, const char* idList) {
    return [=](Chip& chip) { return chip.ReadDashCable(line, idList); };
  };
  struct Row {
    std::vector<std::uint8_t> levels;
    int answer;
  };
  for (const Row& row : {Row{{0x00, 0x01}, 3}, Row{{0x00, 0x00}, 4}, Row{{0x01, 0x01}, 4}}) {
    AnsweringBench bench(Answers{{0xFA0C, row.levels}, {0xFA0D, {0}}, {0xFA0E, {0}}, {0xFA0F, {0}}}, "", true,
                         kController);
    const std::vector<std::uint8_t> before{0x00, 0x08, 0x01, 0x00};
    bench.machine.Hardware().LoadMemory(0xF00000B8, before);
    IchChip chip;
    EXPECT_EQ(bench.Traffic([&] { EXPECT_EQ(detect(-1, ids)(chip) + detect(96, ids)(chip), -2); }), "");
    for (const char* const wrong : {"", "1 2 3", "0x14E4 0x1653 0x103C", "x 0x1653 0x103C 0x3033", "1 2 3 4",
                                    "0x114E4 0x1653 0x103C 0x3033", "1 2 3 4 5"}) {
      EXPECT_EQ(detect(0, wrong)(chip), -1) << wrong;
    }
    const std::string traffic = bench.Traffic([&] { EXPECT_EQ(detect(0, ids)(chip), row.answer); });
    const auto level = [](std::uint8_t bit) { return std::string("FA0C->0000000") + (bit != 0 ? "1 " : "0 "); };
    EXPECT_EQ(traffic, "F00000B8->00080100 F00000B8<-00080900 F00000B8->00080900 F00000B8<-00000900 10ms " +
                           level(row.levels[0]) + "F00000B8->00000900 F00000B8<-00080900 10ms " +
                           level(row.levels[1]));
  }
}

// ---- "hudson"

TEST(HudsonChip, FansAreBytesInMemory) {
  AnsweringBench bench;
  const std::vector<std::uint8_t> fan{0x57, 0, 0, 0x34, 0x12};
  bench.machine.Hardware().LoadMemory(0xFED80400 + 0x66 + 20, fan);
  HudsonChip chip;
  ExpectCases(bench, chip,
              {{Tach(4), 0x1234, "FED8047A->57 FED8047A<-57 100ms FED8047D->34 FED8047E->12 "},
               {Tach(5), 0, ""},
               {Tach(-1), 0, ""},
               {[](Chip& c) { return c.TachToRpm(1000, 9); }, 681, ""},
               {[](Chip& c) { return c.TachToRpm(0, 9) + c.TachToRpm(0xFFFF, 9); }, 0, ""}});
}

TEST(HudsonChip, SharedPinsAreLinesOnlyWhileTheyAreRead) {
  AnsweringBench bench(Answers{{0xCD6, {0}}, {0xCD7, {0x40}}});
  platform::sim::Buses& memory = bench.machine.Hardware();
  memory.WriteMemory(0xFED80100 + 35, 0x80);
  memory.WriteMemory(0xFED80D00 + 35, 0x02);
  memory.WriteMemory(0xFED80100 + 36, 0x7F);
  memory.WriteMemory(0xFED8005A, 0x07);
  HudsonChip chip;
  ExpectCases(bench, chip,
              {{Line(35), 3,
                "0CD6<-EA 0CD7->40 0CD6<-EA 0CD7<-41 FED80D23->02 FED80D23<-03 FED80123->80 FED80D23<-02 0CD6<-EA "
                "0CD7<-40 "},
               {Line(36), 4, "FED80124->7F "},
               {Line(255), 4, "FED801FF->00 "},
               {Line(256), -1, ""},
               {Line(-1), -1, ""},
               {Line(238), 3, "FED8005A->07 FED8005A<-02 10ms FED8005A<-05 "},
               {[&](Chip& c) {
                  memory.WriteMemory(0xFED8005A, 0xFB);
                  return c.ReadLine(238);
                },
                4, "FED8005A->FB "}});
}

TEST(HudsonChip, NamedBitsArePulsed) {
  AnsweringBench bench(Answers{{0xCD6, {0}}, {0xCD7, {0x44, 0x44, 0x40}}}, "", false);
  HudsonChip chip;
  ExpectCases(
      bench, chip,
      {{Named(0x5A, "2"), 3, "0CD6<-5A 0CD7->44 "},
       {Named(0x15A, "2", "1"), 4, "0CD6<-5A 0CD7->44 0CD6<-5A 0CD7<-46 10ms 0CD6<-5A 0CD7<-44 0CD6<-5A 0CD7->40 "},
       {Named(0x5A, "3"), 4, "0CD6<-5A 0CD7->40 "}});
}

// The LED is the elder's, the power management block its own.
TEST(HudsonChip, KeysMoveItsOwnBasesOnly) {
  AnsweringBench bench(IchPorts(),
                       "chip.hudson.pmbar=0x900\nchip.hudson.gpiobar=0x80000000\n"
                       "chip.hudson.indirectioaddr=0xCD0\nchip.ich.pmbar=0x700\n");
  HudsonChip chip;
  ExpectCases(bench, chip,
              {{&Chip::SavePowerButtonState, 1, "0958->FF "},
               {&Chip::AssertPowerLedGreen, 1, "FA0C->80000001 FA0C<-80001001 "},
               {Line(100), 4, "80000064->00 "},
               {Named(0, "0"), 3, "0CD0<-00 0CD1->FF "},
               {Named(0, "8"), 4, "0CD0<-00 0CD1->FF "}});
}

// ---- the others

TEST(IntelC200Chip, BitsOfAWordInMemoryAreLines) {
  AnsweringBench bench({}, "chip.intelc200.rcrbbar=0xFED1C000\nchip.intelc200.spibar=0x3800\n");
  bench.machine.Hardware().WriteMemory(0xFED1F804, 0x01);
  bench.machine.Hardware().WriteMemory(0xFED1F805, 0x80);
  IntelC200Chip chip;
  ExpectCases(bench, chip,
              {{Named(4, "15", "1"), 3, "FED1F804->01 FED1F805->80 "},
               {Named(4, "14"), 4, "FED1F804->01 FED1F805->80 "},
               {Named(4, "16"), 4, "FED1F804->01 FED1F805->80 "}});
}

TEST(McpChip, LinesAreAPortEachAndTheHoodSwitchIsALatch) {
  AnsweringBench bench(Answers{{0x24C0, {0x20}},
                               {0x24FF, {0xD3}},
                               {0x24C1, {0x24}},
                               {0x24C2, {0x28}},
                               {0x2444, {0x06, 0x04, 0x02}},
                               {0x2449, {0x1E}}});
  McpChip chip;
  ExpectCases(bench, chip,
              {{Line(0), 3, "24C0->20 "},
               {Line(63), 4, "24FF->D3 "},
               {Line(1), -1, "24C1->24 "},
               {Line(2), -1, "24C2->28 "},
               {Line(64), -1, ""},
               {Line(240), -1, ""},
               {Line(-1), -1, ""},
               {Line(238), 3, "2449->1E 2449<-1D 2444->06 2444<-04 100ms 2444->04 2449<-1E "},
               {Line(238), 4, "2449->1E 2449<-1D 2444->02 100ms 2444->02 2449<-1E "}});
}

TEST(McpChip, ThePowerButtonIsInItsOwnBlock) {
  AnsweringBench bench(Answers{{0x901, {0x01}}, {0x902, {0x34}}, {0x903, {0x12}}}, "chip.mcp.pmbar=0x900\n");
  McpChip chip;
  ExpectCases(bench, chip,
              {{&Chip::RestorePowerButtonState, 1, ""},
               {&Chip::ArmPowerButton, 1, "0902->1234 0902<-0000 "},
               {&Chip::SavePowerButtonState, 1, ""},
               {Pressed, 1, "0901->01 "},
               {&Chip::RestorePowerButtonState, 1, "0901<-01 0902<-1234 "}});
}

// Configuration space behind 0xCF8 and 0xCFC; all levels are 0 but for the one bit of each row.
TEST(SbxChip, LinesAreBitsInConfigurationSpace) {
  struct Row {
    bool isSb710;
    int line;
    const char* address;
    std::uint32_t mask;
  };
  constexpr Row kRows[] = {
      {false, 0, "8000A080", 0x100},     {false, 3, "8000A080", 0x800},      {false, 4, "8000A0A8", 0x10000},
      {false, 9, "8000A0A8", 0x200000},  {false, 10, "8000A0A8", 0x4000000}, {false, 11, "8000A0A8", 0x400000},
      {false, 12, "8000A0A8", 0x800000}, {false, 49, "8000A050", 0x100},     {false, 52, "8000A050", 0x800},
      {false, 53, "8000A052", 0x100},    {false, 56, "8000A052", 0x800},     {false, 43, "8000A000", 0x20000},
      {false, 44, "8000A000", 0x40000},  {true, 45, "8000A0A6", 0x1000000},  {true, 48, "8000A0A6", 0x8000000},
      {true, 53, "8000A052", 0x1000000}, {true, 56, "8000A052", 0x8000000}};
  for (const Row& row : kRows) {
    for (const std::uint32_t levels : {row.mask, ~row.mask}) {
      const auto byte = [levels](unsigned at) { return static_cast<std::uint8_t>(levels >> (8 * at)); };
      AnsweringBench bench(Answers{{0xCFC, {byte(0)}}, {0xCFD, {byte(1)}}, {0xCFE, {byte(2)}}, {0xCFF, {byte(3)}}});
      const std::unique_ptr<Chip> chip =
          row.isSb710 ? std::unique_ptr<Chip>(std::make_unique<Sb710Chip>()) : std::make_unique<SbxChip>();
      char read[40];
      std::snprintf(read, sizeof read, "0CF8<-%s 0CFC->%08X ", row.address, levels);
      const bool isTwice = !row.isSb710 && (row.line == 43 || row.line == 44);
      ExpectCases(bench, *chip,
                  {{Line(row.line), levels == row.mask ? 3 : 4, isTwice ? std::string(read) + read : read}});
    }
  }
  AnsweringBench bench({},
                       "chip.sbx.smbusbar=0x80009000\nchip.sbx.pciindex=0xC00\nchip.sbx.pcidata=0xC04\n"
                       "chip.Sb710.pciindex=0xC10\n");
  SbxChip sbx;
  Sb710Chip sb710;
  ExpectCases(bench, sbx, {{Line(0), 3, "0C00<-80009080 0C04->FFFFFFFF "}, {Line(13), -1, ""}, {Line(45), -1, ""}});
  ExpectCases(bench, sb710, {{Line(45), 3, "0C10<-8000A0A6 0CFC->FFFFFFFF "}, {Line(0), -1, ""}, {Line(49), -1, ""}});
}

TEST(SbxChip, AHoodSwitchThatIsSetAgainTwiceIsOpen) {
  struct Row {
    std::vector<std::uint8_t> answers;
    int state;
    const char* traffic;
  };
  for (const Row& row :
       {Row{{0xF7}, 4, "0CD6<-54 0CD7->F7 "},
        Row{{0x1A, 0x12}, 4, "0CD6<-54 0CD7->1A 0CD6<-54 0CD7<-1A 10ms 0CD6<-54 0CD7<-12 0CD6<-54 0CD7->12 "},
        Row{{0x1A, 0x18, 0x10},
            4,
            "0CD6<-54 0CD7->1A 0CD6<-54 0CD7<-1A 10ms 0CD6<-54 0CD7<-12 0CD6<-54 0CD7->18 0CD6<-54 0CD7<-18 10ms "
            "0CD6<-54 0CD7<-10 0CD6<-54 0CD7->10 "},
        Row{{0xFF},
            3,
            "0CD6<-54 0CD7->FF 0CD6<-54 0CD7<-FF 10ms 0CD6<-54 0CD7<-F7 0CD6<-54 0CD7->FF 0CD6<-54 0CD7<-FF 10ms "
            "0CD6<-54 0CD7<-F7 0CD6<-54 0CD7->FF "}}) {
    AnsweringBench bench(Answers{{0xCD6, {0}}, {0xCD7, row.answers}}, "", false);
    Sb710Chip chip;
    ExpectCases(bench, chip, {{Line(238), row.state, row.traffic}});
  }
}

// ---- a thread that is told to end at any request or wait

TEST(BridgeChips, WhatIsHeldForAMomentIsLetGoWhereverTheThreadEnds) {
  struct Case {
    std::function<std::unique_ptr<Chip>()> make;
    std::function<void(Chip&)> act;
    std::uint64_t address;  // of the register that must be as at the end of an undisturbed run
    bool isMemory;
  };
  const auto ich = [] { return std::make_unique<IchChip>(); };
  const auto hudson = [] { return std::make_unique<HudsonChip>(); };
  bool ignored = false;
  const Case kCases[] = {
      {ich, [&](Chip& c) { c.ReadIntrusionLatch(12, true, ignored); }, 0x1293, false},
      {hudson, [](Chip& c) { c.ReadLine(238); }, 0xFED8005A, true},
      {hudson, [](Chip& c) { c.ReadLineByNames(0x5A, "2", "1"); }, 0xCD7, false},
      {hudson, [](Chip& c) { c.ReadLine(35); }, 0xFED80D23, true},
      {hudson, [](Chip& c) { c.ReadLine(35); }, 0xCD7, false},
      {ich, [](Chip& c) { c.DetectDashCable(0, "0x14E4 0x1653 0x103C 0x3033"); }, 0xF00000B9, true},
  };
  for (const Case& c : kCases) {
    bool isDone = false;
    for (platform::sim::Microseconds after_us = 0; !isDone; after_us += after_us < 60 ? 2 : 5000) {
      AnsweringBench bench(Answers{{0x1293, {0xFF}}, {0xF866, {0x01}}, {0xF867, {0}}, {0xCD6, {0}}, {0xCD7, {0x40}}},
                           "", true, kController);
      platform::sim::Buses& hardware = bench.machine.Hardware();
      hardware.WriteMemory(0xFED8005A, 0x05);
      hardware.WriteMemory(0xF00000B9, 0x08);
      const auto value = [&] {
        return c.isMemory ? hardware.ReadMemory(c.address)
                          : hardware.ReadPort(static_cast<std::uint16_t>(c.address), 1);
      };
      const std::uint32_t before = value();
      const std::unique_ptr<Chip> chip = c.make();
      bench.EndAfter(after_us, [&] {
        c.act(*chip);
        isDone = true;
      });
      EXPECT_EQ(value(), before) << (&c - kCases) << " " << after_us;
    }
  }
}

}  // namespace
}  // namespace panelglow
