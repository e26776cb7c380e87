// Whole runs show what a part does for a program that speaks to it as its data sheet says. Here is what one that does
// not gets: steps in another order or too early light nothing; and what is under way at the end of a run.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

using Writes = std::vector<Bench::Write>;

// ---- embedded controller

TEST(EmbeddedController, LightsALampWhenEveryByteOfTheCommandsComesInItsTurn) {
  constexpr std::uint16_t kCommand = 0x66;
  constexpr std::uint16_t kData = 0x62;
  constexpr Microseconds kTakes = 12;  // after so long a written byte is taken
  struct Case {
    const char* what;
    Writes writes;
    Microseconds pause_us;
    const char* lit;  // white is the firmware's own
  };
  const Case kCases[] = {
      {"right", {{kCommand, 0xA2}, {kData, 0x01}, {kCommand, 0xEE}, {kData, 0x00}}, kTakes, "amber"},
      {"no pause", {{kCommand, 0xA2}, {kData, 0x01}, {kCommand, 0xEE}, {kData, 0x00}}, 0, "white"},
      {"never shown", {{kCommand, 0xA2}, {kData, 0x01}}, kTakes, "white"},
      {"shown first", {{kCommand, 0xEE}, {kData, 0x00}, {kCommand, 0xA2}, {kData, 0x01}}, kTakes, ""},
      {"another pattern", {{kCommand, 0xA2}, {kData, 0x02}, {kCommand, 0xEE}, {kData, 0x00}}, kTakes, "white"},
      {"no such pattern", {{kCommand, 0xA2}, {kData, 0x07}, {kCommand, 0xEE}, {kData, 0x00}}, kTakes, ""},
      {"no command", {{kData, 0x01}, {kCommand, 0xEE}, {kData, 0x00}}, kTakes, ""},
      {"command at the data port", {{kData, 0xA2}, {kData, 0x01}, {kCommand, 0xEE}, {kData, 0x00}}, kTakes, ""},
      {"interrupted", {{kCommand, 0xA2}, {kCommand, 0x84}, {kData, 1}, {kCommand, 0xEE}, {kData, 0}}, kTakes, ""},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.what);
    Bench bench(MachineText("ec-notebook.toml"));
    bench.Run(c.writes, c.pause_us);
    bench.Wait_us(1000);
    EXPECT_EQ(bench.IsLit("power-amber"), c.lit == std::string("amber"));
    EXPECT_EQ(bench.IsLit("power-white"), c.lit == std::string("white"));
  }
}

// ---- mailbox controller

void Step(Bench& bench, std::uint8_t address, std::uint8_t value, Microseconds pause_us = 50'000) {
  bench.Run({{0x200, address}, {0x201, value}});
  bench.Wait_us(pause_us);
}

void SelectPage(Bench& bench, std::uint16_t page) {
  Step(bench, 0x85, static_cast<std::uint8_t>(page >> 8U));
  Step(bench, 0x84, static_cast<std::uint8_t>(page));
  Step(bench, 0x82, 0x1D);
}

TEST(MailboxController, IsBusyWhileAStepIsUnderWayAndLosesWhatComesMeanwhile) {
  Bench bench(MachineText("mailbox-notebook.toml"));
  SelectPage(bench, 0x4000);
  Step(bench, 0x85, 0xA0);
  Step(bench, 0x84, 0x0F);
  Step(bench, 0x82, 0x01, 10'000);
  bench.Out(0x200, 0x86);
  EXPECT_EQ(bench.In(0x201), 0x48);
  bench.Out(0x201, 0x99);  // lost: the answer stands where it should
  bench.Wait_us(40'000);
  EXPECT_EQ(bench.In(0x201), 0x2C);
}

// What is under way at the end of a run belongs to what the run did.
TEST(MailboxController, AStepThatIsUnderWayCountsInTheComparisonOnceItHasEnded) {
  Bench bench(MachineText("mailbox-notebook.toml"));
  SelectPage(bench, 0x4008);
  Step(bench, 0x85, 0x10);
  Step(bench, 0x84, 0x21);
  Step(bench, 0x86, 0x02);
  const std::string before = bench.machine.HardwareState();
  Step(bench, 0x82, 0x02, 10'000);
  EXPECT_EQ(bench.machine.HardwareState(), before);
  const Microseconds began = bench.machine.Time().Now();
  EXPECT_THAT(bench.machine.SettledState(), ::testing::HasSubstr("40081021:02"));
  EXPECT_NEAR(static_cast<double>(bench.machine.Time().Now() - began), 35'000, 100);
}

// ---- audio codec, behind its controller's immediate commands

constexpr std::uint64_t kCodec = 0xF7F10000;
constexpr std::uint32_t kBusy = 1;
constexpr std::uint32_t kValid = 2;

void Send(Bench& bench, std::uint32_t command) {
  bench.WriteMemory(kCodec + 0x68, kValid, 2);
  bench.WriteMemory(kCodec + 0x60, command, 4);
  bench.WriteMemory(kCodec + 0x68, kBusy, 2);
}

TEST(HdaCodec, ALampGlowsWhenItsPinIsEnabledAnOutputAndLow) {
  struct Case {
    const char* what;
    std::vector<std::uint32_t> commands;
    bool speaker;
    bool microphone;
  };
  const Case kCases[] = {
      {"any order", {0x00171500, 0x00171709, 0x00171609}, true, true},
      {"not enabled", {0x00171701, 0x00171500}, false, false},
      {"an input", {0x00171601, 0x00171500}, false, false},
      {"another node", {0x00271601, 0x00171701, 0x00171500}, false, false},
      {"another codec", {0x20171601, 0x00171701, 0x00171500}, false, false},
      {"wake mask in place of the enable mask", {0x00171801, 0x00171701, 0x00171500}, false, false},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.what);
    Bench bench(MachineText("codec-notebook.toml"));
    for (const std::uint32_t command : c.commands) {
      Send(bench, command);
      bench.Wait_us(100);
    }
    EXPECT_EQ(bench.IsLit("speaker-mute"), c.speaker);
    EXPECT_EQ(bench.IsLit("microphone-mute"), c.microphone);
  }
}

TEST(HdaCodec, ACommandTakesItsTimeOnTheLinkAndCountsInTheComparisonOnceItIsCarried) {
  Bench bench(MachineText("codec-notebook.toml"));
  Send(bench, 0x001F0011);  // the number of GPIO pins
  EXPECT_EQ(bench.ReadMemory(kCodec + 0x68, 2), kBusy);
  Send(bench, 0x00171601);  // too early: it is not sent
  bench.Wait_us(200);
  EXPECT_EQ(bench.ReadMemory(kCodec + 0x68, 2), kValid);
  EXPECT_EQ(bench.ReadMemory(kCodec + 0x64, 4), 4U);
  bench.WriteMemory(kCodec + 0x68, 0, 2);
  EXPECT_EQ(bench.ReadMemory(kCodec + 0x68, 2), kValid);  // cleared by a 1 alone
  Send(bench, 0x00171601);
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
  EXPECT_NE(bench.machine.SettledState(), bench.machine.InitialState());
}

}  // namespace
}  // namespace panelglow::platform::sim
