// The HD Audio codec behind its controller's immediate commands.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

constexpr std::uint64_t kBase = 0xF7F10000;
constexpr std::uint32_t kBusy = 1;
constexpr std::uint32_t kValid = 2;

// Sends a command and gives the status word after 100 us.
std::uint32_t Send(Bench& bench, std::uint32_t command) {
  bench.WriteMemory(kBase + 0x68, kValid, 2);
  bench.WriteMemory(kBase + 0x60, command, 4);
  bench.WriteMemory(kBase + 0x68, kBusy, 2);
  bench.Wait_us(100);
  return bench.ReadMemory(kBase + 0x68, 2);
}

std::uint32_t Ask(Bench& bench, std::uint32_t command) {
  EXPECT_EQ(Send(bench, command), kValid);
  return bench.ReadMemory(kBase + 0x64, 4);
}

TEST(HdaCodec, ALampGlowsWhenItsPinIsEnabledAnOutputAndLow) {
  struct Case {
    const char* what;
    std::vector<std::uint32_t> commands;
    bool speaker;
    bool microphone;
  };
  const Case kCases[] = {
      {"speaker", {0x00171601, 0x00171701, 0x00171500}, true, false},
      {"microphone", {0x00171609, 0x00171709, 0x00171501}, false, true},
      {"any order", {0x00171500, 0x00171709, 0x00171609}, true, true},
      {"high", {0x00171601, 0x00171701, 0x00171501}, false, false},
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
    }
    EXPECT_EQ(bench.IsLit("speaker-mute"), c.speaker);
    EXPECT_EQ(bench.IsLit("microphone-mute"), c.microphone);
  }
}

TEST(HdaCodec, ACommandOnTheLinkCountsInTheComparisonOnceItIsCarried) {
  Bench bench(MachineText("codec-notebook.toml"));
  bench.WriteMemory(kBase + 0x60, 0x00171601, 4);
  bench.WriteMemory(kBase + 0x68, kBusy, 2);
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
  EXPECT_NE(bench.machine.SettledState(), bench.machine.InitialState());
}

TEST(HdaCodec, ACommandTakesItsTimeOnTheLink) {
  Bench bench(MachineText("codec-notebook.toml"));
  bench.WriteMemory(kBase + 0x60, 0x001F0011, 4);  // the number of GPIO pins
  EXPECT_EQ(bench.ReadMemory(kBase + 0x68, 2), 0U);
  bench.WriteMemory(kBase + 0x68, kBusy, 2);
  EXPECT_EQ(bench.ReadMemory(kBase + 0x68, 2), kBusy);
  bench.WriteMemory(kBase + 0x60, 0x00171601, 4);
  bench.WriteMemory(kBase + 0x68, kBusy, 2);  // too early: it is not sent
  bench.Wait_us(200);
  EXPECT_EQ(bench.ReadMemory(kBase + 0x68, 2), kValid);
  EXPECT_EQ(bench.ReadMemory(kBase + 0x64, 4), 4U);
  EXPECT_EQ(Ask(bench, 0x001F1600), 0U);
  bench.WriteMemory(kBase + 0x68, 0, 2);
  EXPECT_EQ(bench.ReadMemory(kBase + 0x68, 2), kValid);  // cleared by a 1 alone
}

TEST(HdaCodec, GivesBackWhatWasSetAndTheLevelOfItsInputs) {
  Bench bench(MachineText("codec-notebook.toml"));
  for (const std::uint32_t command : {0x0017160BU, 0x00171709U, 0x001715F8U}) {
    Send(bench, command);
  }
  EXPECT_EQ(Ask(bench, 0x001F1600), 0x0BU);
  EXPECT_EQ(Ask(bench, 0x001F1700), 0x09U);
  EXPECT_EQ(Ask(bench, 0x001F1500), 0x0AU);  // output 3 is high, input 1 is pulled high; there is no pin above 3
  EXPECT_EQ(Send(bench, 0x20000000), 0U);    // nobody there: no answer
}

TEST(HdaCodec, AHangingControllerStaysBusy) {
  Bench bench(MachineText("codec-notebook.toml", "kind = \"hda-codec\"", "fault = \"stuck-busy\""));
  EXPECT_EQ(Send(bench, 0x00171601), kBusy);
  bench.Wait_us(1'000'000);
  EXPECT_EQ(bench.ReadMemory(kBase + 0x68, 2), kBusy);
}

}  // namespace
}  // namespace panelglow::platform::sim
