// Southbridge parts: what no LED test touches, and what a step that comes too early or is wrong does.
#include <gtest/gtest.h>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

TEST(PortRegisters, EventsClearByOneAndLevelsMoveOutputsAlone) {
  Bench bench(MachineText("ich-desktop.toml"));
  struct Case {
    std::uint16_t port;
    std::uint8_t written, read;
  };
  const Case kCases[] = {
      {0xF800, 0x01, 0x10},  // two events, of which one is cleared
      {0xF800, 0xEE, 0x10}, {0xF802, 0xFF, 0xFF}, {0xF803, 0x00, 0x00}, {0xFA0C, 0xFF, 0x41},  // inputs
      {0xFA0D, 0xFF, 0x90},                        // line 12 is an output, 15 serves another function and is high
      {0xFA0D, 0x00, 0x80}, {0xFA10, 0x55, 0xFF},  // no such register
  };
  for (const Case& c : kCases) {
    bench.Out(c.port, c.written);
    EXPECT_EQ(bench.In(c.port), c.read) << std::hex << c.port << " <- " << unsigned{c.written};
  }
  EXPECT_FALSE(bench.IsLit("power-green"));
}

TEST(SmbusHost, ATransferTakesItsTimeAndTellsHowItEnded) {
  constexpr std::uint16_t kBase = 0x5000;
  struct Case {
    std::uint8_t protocol, address, command;
    std::uint8_t status, data;  // data was 0x77
  };
  const Case kCases[] = {
      {7, 0x58, 0x03, 0x80, 0xC0}, {7, 0x59, 0x04, 0x80, 0x01},  // bit 0 of the address does not count
      {7, 0x2C, 0x03, 0x10, 0x77},                               // nobody has this address
      {7, 0x58, 0x06, 0x12, 0x77}, {9, 0x58, 0x03, 0x17, 0x77},
      {6, 0xA0, 0x00, 0x80, 0x77},  // what is written is lost
      {7, 0xA0, 0x00, 0x80, 0x80},
  };
  Bench bench(MachineText("smbus-desktop.toml"));
  for (const Case& c : kCases) {
    bench.Run({{kBase + 2, c.address}, {kBase + 3, c.command}, {kBase + 4, 0x77}, {kBase, c.protocol}});
    EXPECT_EQ(bench.In(kBase + 1), 0x1A);
    bench.Run({{kBase + 3, 0x05}, {kBase + 4, 0x00}, {kBase, 6}});  // too early
    EXPECT_EQ(bench.In(kBase + 4), 0x77);
    bench.Wait_us(1000);
    EXPECT_EQ(bench.In(kBase + 1), c.status) << unsigned{c.address} << ":" << unsigned{c.command};
    EXPECT_EQ(bench.In(kBase + 4), c.data);
    EXPECT_EQ(bench.In(kBase), 0);
    EXPECT_EQ(bench.In(kBase + 1), 0);
  }
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
}

TEST(PciDoorway, ADwordSelectsARegisterOfAFunction) {
  Bench bench(
      "[[pci]]\ndevice = 0x14\n[pci.registers]\n\"00\" = 0x43851002\n\"50\" = 0x12345678\n"
      "[[pci]]\nbus = 1\ndevice = 2\nfunction = 3\n[pci.registers]\n\"50\" = 0xCAFE0000\n");
  const std::pair<std::uint32_t, std::uint32_t> kReads[] = {
      {0x8000A000, 0x43851002}, {0x8000A050, 0x12345678}, {0x8000A052, 0x12345678},  // the lowest bits do not count
      {0x80011350, 0xCAFE0000}, {0x0000A050, 0xFFFFFFFF}, {0x8000A850, 0xFFFFFFFF}};
  for (const auto& [address, value] : kReads) {
    bench.OutDword(0xCF8, address);
    EXPECT_EQ(bench.InDword(0xCFC), value) << std::hex << address;
  }
  bench.OutDword(0xCF8, 0x8000A050);
  bench.Out(0xCF9, 0x00);  // a byte there is for another register
  bench.Out(0xCF8, 0x00);
  EXPECT_EQ(bench.InDword(0xCF8), 0x8000A050U);
  EXPECT_EQ(bench.In(0xCFD), 0x56);
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
  bench.Out(0xCFE, 0xAB);
  EXPECT_EQ(bench.InDword(0xCFC), 0x12AB5678U);
  EXPECT_NE(bench.machine.HardwareState(), bench.machine.InitialState());
}

}  // namespace
}  // namespace panelglow::platform::sim
