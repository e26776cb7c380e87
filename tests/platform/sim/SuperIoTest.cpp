// The Super-I/O's three families: configuration mode, logical devices, lamps that blink by themselves, GPIO lines,
// the environment controller.
#include <gmock/gmock.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

using ::testing::HasSubstr;
using Writes = std::vector<Bench::Write>;

constexpr std::uint16_t kIte = 0x2E;
constexpr std::uint16_t kOther = 0x4E;

Writes Keys(std::uint16_t port, const std::vector<std::uint8_t>& keys) {
  Writes writes;
  for (const std::uint8_t key : keys) {
    writes.emplace_back(port, key);
  }
  return writes;
}

const std::vector<std::uint8_t> kIteKeys{0x87, 0x01, 0x55, 0x55};

// Registers of the configuration space, one after the other.
Writes Registers(std::uint16_t port, const Writes& values) {
  Writes writes;
  for (const auto& [address, value] : values) {
    writes.emplace_back(port, static_cast<std::uint8_t>(address));
    writes.emplace_back(static_cast<std::uint16_t>(port + 1), value);
  }
  return writes;
}

Writes operator+(Writes left, const Writes& right) {
  left.insert(left.end(), right.begin(), right.end());
  return left;
}

TEST(SuperIo, OpensToItsOwnKeysAloneAndClosesAgain) {
  struct Case {
    const char* machine;
    std::uint16_t port;
    Writes enter;
    bool opens;
  };
  const Case kCases[] = {
      {"sio-ite.toml", kIte, Keys(kIte, kIteKeys), true},
      {"sio-ite.toml", kIte, Keys(kIte, {0x87, 0x87, 0x01, 0x55, 0x55}), true},  // the row begins again
      {"sio-ite.toml", kIte, Keys(kIte, {0x87, 0x01, 0x55, 0xAA}), false},       // the keys of the other place
      {"sio-ite.toml", kIte, Keys(kIte, {0x87, 0x55, 0x01, 0x55}), false},
      {"sio-ite.toml", kIte, Keys(kIte, {0x01, 0x55, 0x55}), false},
      {"sio-ite.toml", kIte, Keys(kIte, {0x87, 0x01}) + Writes{{kIte + 1, 0}} + Keys(kIte, {0x55, 0x55}), false},
      {"sio-ite.toml", kIte, Keys(kOther, kIteKeys), false},
      {"sio-fintek.toml", kOther, Keys(kOther, {0x87, 0x87}), true},
      {"sio-fintek.toml", kOther, Keys(kOther, {0x87}), false},
      {"sio-fintek.toml", kOther, Keys(kOther, kIteKeys), false},
      {"sio-fintek.toml", kOther, Keys(kOther, {0x87, 0x01, 0x87}), false},
      {"sio-generic.toml", kOther, Keys(kOther, {0x87, 0x87}), true},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.machine);
    Bench bench(MachineText(c.machine));
    bench.Run(c.enter + Writes{{c.port, 0x20}});
    EXPECT_EQ(bench.In(static_cast<std::uint16_t>(c.port + 1)) != 0xFF, c.opens) << ::testing::PrintToString(c.enter);
    EXPECT_THAT(bench.machine.HardwareState(), HasSubstr(c.opens ? "mode = open" : "mode = closed"));
    bench.Run(c.port == kIte ? Registers(kIte, {{0x02, 0x02}}) : Writes{{kOther, 0xAA}});
    bench.Out(c.port, 0x20);
    EXPECT_EQ(bench.In(static_cast<std::uint16_t>(c.port + 1)), 0xFF);
    EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
  }
}

TEST(SuperIo, TheExitOfAnotherFamilyLeavesItOpen) {
  const auto stateAfter = [](const char* machine, const Writes& writes) {
    Bench bench(MachineText(machine));
    bench.Run(writes);
    return bench.machine.HardwareState();
  };
  EXPECT_THAT(stateAfter("sio-ite.toml", Keys(kIte, kIteKeys) + Keys(kIte, {0xAA})), HasSubstr("mode = open"));
  EXPECT_THAT(stateAfter("sio-fintek.toml", Keys(kOther, {0x87, 0x87}) + Registers(kOther, {{0x02, 0x02}})),
              HasSubstr("mode = open"));
}

struct Slip {
  const char* what;
  std::size_t step;                   // of the procedure
  std::vector<Bench::Write> instead;  // in its place
};

// A lamp that is dark at first must blink when the procedure is done, and stay dark with any of the slips in it.
void ExpectBlinksUnlessSlipped(const std::string& machine, const std::string& led, const Writes& procedure,
                               const std::vector<Slip>& slips) {
  const auto blinks = [&](const Writes& writes) {
    Bench bench(machine);
    bench.Run(writes);
    bench.Wait_us(5'000'000);
    return bench.Edges(led, 1).size() > 4;
  };
  EXPECT_TRUE(blinks(procedure));
  for (const Slip& slip : slips) {
    Writes writes = procedure;
    const auto at = writes.begin() + static_cast<std::ptrdiff_t>(slip.step);
    const auto behind = writes.erase(at);
    writes.insert(behind, slip.instead.begin(), slip.instead.end());
    EXPECT_FALSE(blinks(writes)) << slip.what;
  }
}

TEST(SuperIo, AnIteLampBlinksWhenEveryStepIsRight) {
  std::string machine = MachineText("sio-ite.toml");
  machine.replace(machine.find("\"26\" = 0x0C"), 11, "\"26\" = 0x00");  // the pins are not yet given to GPIO
  const Writes procedure =
      Keys(kIte, kIteKeys) +
      Registers(kIte, {{0x07, 0x07}, {0x26, 0x0C}, {0xC1, 0x00}, {0xFA, 0x13}, {0xFB, 0x02}, {0x02, 0x02}});
  ExpectBlinksUnlessSlipped(machine, "power-red", procedure,
                            {{"wrong key", 2, {{kIte, 0x54}}},
                             {"key left out", 0, {}},
                             {"another device selected", 5, {{kIte + 1, 0x04}}},
                             {"a device that is not there", 5, {{kIte + 1, 0x09}}},
                             {"no device selected", 4, {{kIte, 0x08}}},
                             {"pin left to its first function", 7, {{kIte + 1, 0x04}}},
                             {"line left to its level port", 9, {{kIte + 1, 0x08}}},
                             {"another line", 11, {{kIte + 1, 0x12}}},
                             {"held low", 13, {{kIte + 1, 0x03}}},
                             {"left too early", 10, {{kIte, 0x02}, {kIte + 1, 0x02}, {kIte, 0xFA}}}});
}

TEST(SuperIo, AFintekLampBlinksWhenEveryStepIsRight) {
  const Writes procedure =
      Keys(kOther, {0x87, 0x87}) + Registers(kOther, {{0x07, 0x0A}, {0xF9, 0x03}}) + Writes{{kOther, 0xAA}};
  ExpectBlinksUnlessSlipped(MachineText("sio-fintek.toml"), "power-red", procedure,
                            {{"one key only", 1, {}},
                             {"another device selected", 3, {{kOther + 1, 0x06}}},
                             {"the other lamp", 4, {{kOther, 0xF8}}},
                             {"mode of a sleeping state", 5, {{kOther + 1, 0x0C}}},
                             {"left too early", 4, {{kOther, 0xAA}, {kOther, 0xF9}}}});
}

TEST(SuperIo, ALampBlinksAtTheRateOfItsRegister) {
  struct Case {
    const char* machine;
    Writes enter;
    Writes registers;
    Microseconds half_us;
  };
  const Writes iteKeys = Keys(kIte, kIteKeys);
  const Writes otherKeys = Keys(kOther, {0x87, 0x87});
  const Case kCases[] = {
      {"sio-ite.toml", iteKeys, Registers(kIte, {{7, 7}, {0xC1, 0}, {0xF8, 0x13}, {0xF9, 0}}), 125'000},
      {"sio-ite.toml", iteKeys, Registers(kIte, {{7, 7}, {0xC1, 0}, {0xF8, 0x13}, {0xF9, 2}}), 500'000},
      {"sio-ite.toml", iteKeys, Registers(kIte, {{7, 7}, {0xC1, 0}, {0xFA, 0x13}, {0xFB, 4}}), 2'000'000},
      {"sio-ite.toml", iteKeys, Registers(kIte, {{7, 7}, {0xC1, 0}, {0xFA, 0x13}, {0xFB, 6}}), 4'000'000},
      {"sio-fintek.toml", otherKeys, Registers(kOther, {{7, 10}, {0xF9, 2}}), 1'000'000},
      {"sio-fintek.toml", otherKeys, Registers(kOther, {{7, 10}, {0xF9, 3}}), 500'000},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.half_us);
    Bench bench(MachineText(c.machine));
    bench.Run(c.enter + c.registers);
    bench.Wait_us(40'000'000);
    const std::vector<Microseconds> edges = bench.Edges("power-red", 1);
    ASSERT_GE(edges.size(), 9U);
    for (std::size_t i = 2; i < edges.size(); ++i) {  // the first part is cut by the moment of the write
      EXPECT_EQ(edges[i] - edges[i - 1], c.half_us);
    }
  }
}

TEST(SuperIo, PolarityAndLevelPortDriveAnIteLine) {
  Bench bench(MachineText("sio-ite.toml"));
  EXPECT_TRUE(bench.IsLit("power-green"));
  EXPECT_EQ(bench.In(0xA21), 0x04);
  bench.Out(0xA21, 0x08);
  EXPECT_FALSE(bench.IsLit("power-green"));
  EXPECT_TRUE(bench.IsLit("power-red"));
  bench.Run(Keys(kIte, kIteKeys) + Registers(kIte, {{7, 7}, {0xB1, 0x0C}}));
  EXPECT_TRUE(bench.IsLit("power-green"));
  EXPECT_FALSE(bench.IsLit("power-red"));
  bench.Run(Registers(kIte, {{0xC9, 0x08}}));  // line 22 is an input now
  EXPECT_FALSE(bench.IsLit("power-green"));
}

TEST(SuperIo, FintekLinesAreConfigurationRegisters) {
  Bench bench(MachineText("sio-fintek.toml") +
              "[[led]]\nname = \"line\"\nsymbol = \"s\"\ncolor = \"c\"\ndevice = \"super-io\"\npin = \"GP11\"\n");
  bench.Run(Keys(kOther, {0x87, 0x87}) + Registers(kOther, {{7, 6}, {0xE1, 0x02}}));
  EXPECT_FALSE(bench.IsLit("line"));
  bench.Run(Registers(kOther, {{0xE0, 0x06}, {0xE2, 0xFF}}));
  EXPECT_TRUE(bench.IsLit("line"));
  EXPECT_EQ(bench.In(kOther + 1), 0x23);  // the pins: inputs 0x21, and line 11
  bench.Out(kOther, 0xE1);
  EXPECT_EQ(bench.In(kOther + 1), 0x02);
}

TEST(SuperIo, APlainLevelPortMovesItsOutputsAlone) {
  Bench bench(MachineText("sio-generic.toml"));
  bench.Out(0xA40, 0xFE);
  EXPECT_EQ(bench.In(0xA40), 0x02);
  EXPECT_TRUE(bench.IsLit("power-red"));
  EXPECT_FALSE(bench.IsLit("power-green"));
  bench.Out(0xA41, 0xCF);
  EXPECT_EQ(bench.In(0xA41), 0x30);
  bench.Run(Keys(kOther, {0x87, 0x87}) + Registers(kOther, {{7, 7}, {0x30, 0}}));
  EXPECT_EQ(bench.In(0xA40), 0xFF);  // a device that is switched off answers nowhere
}

TEST(SuperIo, TheEnvironmentControllerStandsWhereItsBaseAddressSays) {
  Bench bench(MachineText("sio-ite.toml"));
  bench.Out(0xA15, 0x63);
  EXPECT_EQ(bench.In(0xA16), 0x7F);
  bench.Out(0xA16, 0x40);
  EXPECT_EQ(bench.In(0xA16), 0x40);
  EXPECT_NE(bench.machine.HardwareState(), bench.machine.InitialState());
  bench.Run({{0xA15, 0x29}, {0xA16, 0x11}});
  EXPECT_EQ(bench.In(0xA16), 0x2A);  // a temperature is no setting
  bench.Run(Keys(kIte, kIteKeys) + Registers(kIte, {{7, 4}, {0x61, 0x30}}));
  EXPECT_EQ(bench.In(0xA16), 0xFF);
  EXPECT_EQ(bench.In(0xA36), 0x2A);
  bench.Run(Registers(kIte, {{0x30, 0}}));
  EXPECT_EQ(bench.In(0xA36), 0xFF);
}

TEST(SuperIo, TheCaseSwitchsLatchComesBackWhileTheCaseIsOpen) {
  for (const bool isOpen : {false, true}) {
    SCOPED_TRACE(isOpen);
    Bench bench(MachineText("sio-fintek.toml", "[chip.environment.intrusion]", isOpen ? "is_open = true" : ""));
    bench.Run({{0x22A, 0x03}});
    EXPECT_EQ(bench.In(0x22B) & 1, 1);  // it was opened before
    bench.Out(0x22B, 0x01);
    EXPECT_EQ(bench.In(0x22B) & 1, 0);
    bench.Wait_us(100'000);
    EXPECT_EQ(bench.In(0x22B) & 1, isOpen ? 1 : 0);
  }
}

}  // namespace
}  // namespace panelglow::platform::sim
