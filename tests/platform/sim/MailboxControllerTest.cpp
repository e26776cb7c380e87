// The mailbox controller: steps and their time, pages, multiplexers.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

using ::testing::HasSubstr;
using Writes = std::vector<Bench::Write>;

constexpr Microseconds kPause = 50'000;

// A mailbox register.
void Step(Bench& bench, std::uint8_t address, std::uint8_t value, Microseconds pause_us = kPause) {
  bench.Run({{0x200, address}, {0x201, value}});
  bench.Wait_us(pause_us);
}

void SelectPage(Bench& bench, std::uint16_t page) {
  Step(bench, 0x85, static_cast<std::uint8_t>(page >> 8U));
  Step(bench, 0x84, static_cast<std::uint8_t>(page));
  Step(bench, 0x82, 0x1D);
}

void WriteByte(Bench& bench, std::uint16_t address, std::uint8_t value, Microseconds pause_us = kPause) {
  Step(bench, 0x85, static_cast<std::uint8_t>(address >> 8U), pause_us);
  Step(bench, 0x84, static_cast<std::uint8_t>(address), pause_us);
  Step(bench, 0x86, value, pause_us);
  Step(bench, 0x82, 0x02, pause_us);
}

TEST(MailboxController, LightsALampBehindItsMultiplexerStepByStep) {
  struct Case {
    const char* what;
    std::uint16_t page;
    std::uint8_t mux;
    Microseconds pause_us;
    bool lit;
  };
  const Case kCases[] = {
      {"right", 0x4008, 0x02, kPause, true},
      {"multiplexer left to the firmware", 0x4008, 0x12, kPause, false},
      {"another page", 0x4000, 0x02, kPause, false},
      {"steps too early", 0x4008, 0x02, 20'000, false},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.what);
    Bench bench(MachineText("mailbox-notebook.toml"));
    SelectPage(bench, c.page);
    WriteByte(bench, 0x1021, c.mux, c.pause_us);
    WriteByte(bench, 0x1022, 0x01, c.pause_us);
    EXPECT_EQ(bench.IsLit("charge-white"), c.lit);
    EXPECT_FALSE(bench.IsLit("charge-amber"));
  }
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
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
  bench.Run({{0x200, 0x86}, {0x201, 0x77}});
  bench.Out(0x200, 0x84);
  EXPECT_EQ(bench.In(0x201), 0x0F);  // the index is taken at any time
}

TEST(MailboxController, ALampOnAPortNeedsNoStepButItsMultiplexer) {
  Bench bench(MachineText("mailbox-notebook.toml"));
  bench.Out(0xA5D, 0x00);
  EXPECT_TRUE(bench.IsLit("power-white"));  // the firmware's
  SelectPage(bench, 0x4008);
  const Microseconds began = bench.machine.Time().Now();
  WriteByte(bench, 0x1019, 0x00);
  EXPECT_FALSE(bench.IsLit("power-white"));
  const std::vector<Microseconds> edges = bench.Edges("power-white", 1);
  ASSERT_EQ(edges.size(), 1U);
  EXPECT_NEAR(static_cast<double>(edges[0] - began), 3 * 50'000 + 45'000, 100);  // when the last step has ended
  bench.Out(0xA5D, 0x01);
  EXPECT_TRUE(bench.IsLit("power-white"));
}

TEST(MailboxController, TheConfigurationPortsSpeakAfterTheirKey) {
  Bench bench(MachineText("mailbox-notebook.toml"));
  EXPECT_EQ(bench.In(0x2F), 0xFF);
  bench.Run({{0x4E, 0x20}});
  EXPECT_EQ(bench.In(0x4F), 0xFF);
  bench.Run({{0x4E, 0x55}, {0x4E, 0x20}});
  EXPECT_EQ(bench.In(0x4F), 0x2A);
  EXPECT_THAT(bench.machine.HardwareState(), HasSubstr("configuration mode = open"));
  bench.Out(0x4E, 0xAA);
  EXPECT_EQ(bench.In(0x4F), 0xFF);
}

// What is under way at the end of a run belongs to what the run did.
TEST(MailboxController, AStepThatIsUnderWayCountsInTheComparisonOnceItHasEnded) {
  Bench bench(MachineText("mailbox-notebook.toml"));
  SelectPage(bench, 0x4008);
  WriteByte(bench, 0x1021, 0x02);
  const std::string before = bench.machine.HardwareState();
  Step(bench, 0x86, 0x12);
  Step(bench, 0x82, 0x02, 10'000);
  EXPECT_EQ(bench.machine.HardwareState(), before);
  const Microseconds began = bench.machine.Time().Now();
  EXPECT_THAT(bench.machine.SettledState(), HasSubstr("40081021:12"));
  EXPECT_NEAR(static_cast<double>(bench.machine.Time().Now() - began), 35'000, 100);
}

TEST(MailboxController, AHangingOneStaysBusy) {
  Bench bench(MachineText("mailbox-notebook.toml", "kind = \"mailbox-controller\"", "fault = \"stuck-busy\""));
  SelectPage(bench, 0x4008);
  WriteByte(bench, 0x1021, 0x02);
  WriteByte(bench, 0x1022, 0x01);
  bench.Out(0x200, 0x86);
  EXPECT_EQ(bench.In(0x201), 0x48);
  EXPECT_FALSE(bench.IsLit("charge-white"));
}

}  // namespace
}  // namespace panelglow::platform::sim
