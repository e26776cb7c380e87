// Banks and GPIO lines in configuration registers: what no LED test touches, or cannot see.
#include <gtest/gtest.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

std::uint8_t Read(Bench& bench, std::uint16_t port, std::uint8_t index) {
  bench.Out(port, index);
  return bench.In(static_cast<std::uint16_t>(port + 1));
}

void Write(Bench& bench, std::uint16_t port, std::uint8_t index, std::uint8_t value) {
  bench.Run({{port, index}, {static_cast<std::uint16_t>(port + 1), value}});
}

TEST(TableSuperIo, AMonitorsBankedRegistersAreThoseOfTheSelectedBank) {
  constexpr std::uint16_t kMonitor = 0x295;
  Bench bench(MachineText("sio-win.toml"));
  const std::pair<std::uint8_t, std::uint8_t> kTemperatures[] = {
      {0, 0xFF}, {1, 0x15}, {2, 0x18}, {3, 0xFF}, {0x81, 0x15}};  // the upper bits of the bank register do not count
  for (const auto& [bank, temperature] : kTemperatures) {
    Write(bench, kMonitor, 0x4E, bank);
    EXPECT_EQ(Read(bench, kMonitor, 0x50), temperature) << unsigned{bank};
    EXPECT_EQ(Read(bench, kMonitor, 0x27), 0x26) << unsigned{bank};
  }
  Write(bench, kMonitor, 0x5D, 0x20);  // not in this bank
  Write(bench, kMonitor, 0x50, 0x40);  // a reading
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
  bench.Run({{kMonitor, 0x4E}, {kMonitor + 1, 0x00}, {kMonitor, 0x5D}, {kMonitor + 1, 0x20}});
  EXPECT_NE(bench.machine.HardwareState(), bench.machine.InitialState());
}

TEST(TableSuperIo, ALineIsReadAtItsPinUnlessItIsAnOutput) {
  constexpr std::uint16_t kPort = 0x4E;
  Bench bench(MachineText("sio-nct5571.toml", "function = 0xEB", "inputs = 0x81"));
  bench.Run({{kPort, 0x87}, {kPort, 0x87}, {kPort, 0x07}, {kPort + 1, 0x09}});
  struct Case {
    std::uint8_t direction, data, inversion, function;  // written; a clear direction bit is an output
    std::uint8_t readData, status;
  };
  const Case kCases[] = {{0xFF, 0x00, 0x00, 0x00, 0x81, 0x81},
                         {0xFF, 0x7E, 0x0F, 0x00, 0x8E, 0x81},
                         {0xF0, 0x0A, 0x00, 0x00, 0x8A, 0x8A},
                         {0xF0, 0x0A, 0x03, 0x00, 0x8A, 0x89},
                         {0xF0, 0x0A, 0x00, 0x0F, 0x81, 0x81}};
  for (const Case& c : kCases) {
    Write(bench, kPort, 0xF4, c.direction);
    Write(bench, kPort, 0xF5, c.data);
    Write(bench, kPort, 0xF6, c.inversion);
    Write(bench, kPort, 0xEB, c.function);
    Write(bench, kPort, 0xF7, 0x55);  // is read only
    EXPECT_EQ(Read(bench, kPort, 0xF5), c.readData) << unsigned{c.inversion};
    EXPECT_EQ(Read(bench, kPort, 0xF7), c.status) << unsigned{c.inversion};
  }
}

TEST(TableSuperIo, ASelectedPinsConfigurationIsItsOwn) {
  constexpr std::uint16_t kPort = 0x2E;  // it needs no keys
  Bench bench(MachineText("sio-wpcd376.toml"));
  Write(bench, kPort, 0x25, 0x58);
  Write(bench, kPort, 0x07, 0x07);
  Write(bench, kPort, 0xF0, 0x04);
  Write(bench, kPort, 0xF1, 0x02);  // no output any more
  Write(bench, kPort, 0xF0, 0x06);
  EXPECT_EQ(Read(bench, kPort, 0xF1), 0x03);
  EXPECT_TRUE(bench.IsLit("power-green"));
  bench.Out(0x420, 0x10);
  EXPECT_FALSE(bench.IsLit("power-red"));
}

}  // namespace
}  // namespace panelglow::platform::sim
