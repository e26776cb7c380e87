// The embedded controller: its two buffers, its commands, its lamps.
#include <gmock/gmock.h>

#include <optional>
#include <string>
#include <vector>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

constexpr std::uint16_t kCommand = 0x66;
constexpr std::uint16_t kData = 0x62;
constexpr std::uint8_t kOutputFull = 0x01;
constexpr std::uint8_t kInputFull = 0x02;

constexpr const char* kKind = "kind = \"embedded-controller\"";
constexpr Microseconds kTakes = 12;  // after so long a written byte is taken

// Reads the status until the bits under `mask` are `wanted`; how long that took, or nothing after 10 ms.
std::optional<Microseconds> Await(Bench& bench, std::uint16_t port, std::uint8_t mask, std::uint8_t wanted) {
  const Microseconds began = bench.machine.Time().Now();
  while ((bench.In(port) & mask) != wanted) {
    if (bench.machine.Time().Now() > began + 10'000) {
      return std::nullopt;
    }
  }
  return bench.machine.Time().Now() - began;
}

TEST(EmbeddedController, IsEmptyAtFirstTakesAByteSoonAndAnswersLater) {
  Bench bench(MachineText("ec-notebook.toml"));
  EXPECT_EQ(bench.In(kCommand), 0);
  EXPECT_EQ(Await(bench, kCommand, kOutputFull, kOutputFull), std::nullopt);  // nobody asked for anything
  bench.Out(kCommand, 0x80);
  EXPECT_EQ(bench.In(kCommand) & (kOutputFull | kInputFull), kInputFull);
  EXPECT_LE(Await(bench, kCommand, kInputFull, 0), Microseconds{12});
  bench.Out(kData, 0x67);
  EXPECT_LE(Await(bench, kCommand, kInputFull, 0), Microseconds{12});
  EXPECT_EQ(bench.In(kCommand) & kOutputFull, 0);
  const std::optional<Microseconds> answered = Await(bench, kCommand, kOutputFull, kOutputFull);
  ASSERT_TRUE(answered);
  EXPECT_GE(*answered, Microseconds{40});
  EXPECT_EQ(bench.In(kData), 0x04);
  EXPECT_EQ(bench.In(kCommand) & kOutputFull, 0);
  EXPECT_EQ(bench.In(kData), 0x04);  // an empty buffer shows what was in it last
}

// The answer to a command.
std::uint8_t Answer(Bench& bench, const std::vector<Bench::Write>& writes) {
  bench.Run(writes, 500);
  EXPECT_TRUE(Await(bench, writes.front().first, kOutputFull, kOutputFull));
  return bench.In(static_cast<std::uint16_t>(writes.front().first - 4));
}

TEST(EmbeddedController, ReadsWritesQueriesAndSetsADuty) {
  Bench bench(MachineText("ec-notebook.toml"));
  EXPECT_EQ(Answer(bench, {{kCommand, 0x80}, {kData, 0x58}}), 0x2D);
  bench.Run({{kCommand, 0x81}, {kData, 0x58}, {kData, 0x33}}, kTakes);
  EXPECT_EQ(Answer(bench, {{kCommand, 0x80}, {kData, 0x58}}), 0x33);
  EXPECT_EQ(Answer(bench, {{kCommand, 0x84}}), 0);
  bench.Run({{kCommand, 0xC1}, {kData, 0x04}, {kData, 0x57}}, kTakes);
  bench.Out(kData, 0x80);  // which is still to be taken
  EXPECT_THAT(bench.machine.HardwareState(), ::testing::HasSubstr("ec duties =\n"));
  EXPECT_THAT(bench.machine.SettledState(), ::testing::HasSubstr("ec duties = 0457:80\n"));
}

TEST(EmbeddedController, AWideAddressIsTwoBytesAndTheHighOneComesFirst) {
  Bench bench(MachineText("ec16-notebook.toml"));
  EXPECT_EQ(Answer(bench, {{0x6C, 0x80}, {0x68, 0x01}, {0x68, 0x34}}), 0x0B);
  bench.Run({{0x6C, 0x80}, {0x68, 0x34}}, 500);  // half an address
  EXPECT_EQ(Await(bench, 0x6C, kOutputFull, kOutputFull), std::nullopt);
}

TEST(EmbeddedController, LightsALampWhenEveryByteOfTheCommandsComesInItsTurn) {
  struct Case {
    const char* what;
    std::vector<Bench::Write> writes;
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
      {"given back", {{kCommand, 0xA2}, {kData, 0x01}, {kCommand, 0xEE}, {kData, 0x01}}, kTakes, "white"},
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

TEST(EmbeddedController, ALampMovesWhenTheFirmwareTakesTheByteNotWhenItIsWritten) {
  Bench bench(MachineText("ec16-notebook.toml"));
  bench.Run({{0x6C, 0xD4}, {0x68, 0x02}}, 500);
  const Microseconds written = bench.machine.Time().Now();
  bench.Out(0x68, 0x01);
  bench.Wait_us(1000);
  EXPECT_EQ(bench.Edges("power-amber", 1), std::vector<Microseconds>{written + 402});  // the write itself takes 2
  EXPECT_TRUE(bench.IsLit("power-white"));  // a single lamp's command leaves the other one
}

TEST(EmbeddedController, ALampCanHangOnItsMemory) {
  Bench bench(MachineText("ec-notebook.toml", "automatic = [\"white\"]",
                          "[[chip.lamp]]\nname = \"bit\"\naddress = 0x3D\nbit = 1") +
              "[[led]]\nname = \"bit\"\nsymbol = \"s\"\ncolor = \"c\"\ndevice = \"ec\"\npin = \"bit\"\n");
  bench.Run({{kCommand, 0x81}, {kData, 0x3D}, {kData, 0xF3}}, kTakes);
  EXPECT_TRUE(bench.IsLit("bit"));
  bench.Run({{kCommand, 0x81}, {kData, 0x3D}, {kData, 0xF0}}, kTakes);
  EXPECT_FALSE(bench.IsLit("bit"));
}

TEST(EmbeddedController, AHangingFirmwareTakesNothing) {
  Bench bench(MachineText("ec-notebook.toml", kKind, "fault = \"stuck-ibf\""));
  bench.Out(kCommand, 0xA2);
  EXPECT_EQ(Await(bench, kCommand, kInputFull, 0), std::nullopt);
  bench.Run({{kData, 0x01}, {kCommand, 0xEE}, {kData, 0x00}}, 20'000);
  EXPECT_FALSE(bench.IsLit("power-amber"));
}

TEST(EmbeddedController, OneThatNeverAnswersStillTakesCommands) {
  Bench bench(MachineText("ec-notebook.toml", kKind, "fault = \"stuck-obf\""));
  bench.Run({{kCommand, 0x80}, {kData, 0x58}}, kTakes);
  EXPECT_EQ(Await(bench, kCommand, kOutputFull, kOutputFull), std::nullopt);
  bench.Run({{kCommand, 0xA2}, {kData, 0x01}, {kCommand, 0xEE}, {kData, 0x00}}, kTakes);
  EXPECT_TRUE(bench.IsLit("power-amber"));
}

}  // namespace
}  // namespace panelglow::platform::sim
