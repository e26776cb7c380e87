// The disk that watches its writes and ends its requests, and the floppy drive's lamp.
#include <gmock/gmock.h>

#include <functional>

#include "platform/sim/Bench.h"

namespace panelglow::platform::sim {
namespace {

using ::testing::HasSubstr;

std::string DiskText(const std::string& more = {}) {
  return "[[controller]]\nname = \"sata\"\nid = 'X\\1'\n"
         "[[disk]]\nname = \"first\"\ncontroller = \"sata\"\nid = 'X\\2'\n" +
         more +
         "\n[[led]]\nname = \"first\"\nsymbol = \"s\"\ncolor = \"green\"\ndevice = \"first\"\npin = \"activity\"\n";
}

class Disk {
 public:
  explicit Disk(Simulation& machine)
      : block(machine.TheMachine().rawDisks.Allocate(0x8000)),
        handle(machine.TheMachine().rawDisks.Open(R"(\\.\physicaldrive0)")) {}

  std::size_t Read(std::uint64_t at = 0x100000) { return handle->Seek(at) ? handle->Read(block->Bytes()) : 0; }
  std::size_t Write(std::uint64_t at = 0x100000) { return handle->Seek(at) ? handle->Write(block->Bytes()) : 0; }

  std::unique_ptr<DiskBlock> block;
  std::unique_ptr<RawDisk> handle;
};

// What a run must never do to a stranger's disk is left behind for all to see.
TEST(SimulatedDisk, TellsOfEveryWriteThatNoTestMayMake) {
  struct Case {
    const char* name;
    std::function<void(Disk&)> act;
    const char* told;
    bool contentStays;
  };
  const Case kCases[] = {
      {"as it must be", [](Disk& disk) { disk.Read(), disk.Write(); }, "writes = only what was read", true},
      {"what was never read", [](Disk& disk) { disk.Write(); }, "1 forbidden, the first of 32768 bytes at 0x100000",
       false},
      {"another byte", [](Disk& disk) { disk.Read(), disk.block->Bytes()[9] ^= std::byte{1}, disk.Write(); },
       "1 forbidden", false},
      {"twice", [](Disk& disk) { disk.Read(), disk.Write(), disk.Write(); }, "1 forbidden", true},
      {"ahead of the block", [](Disk& disk) { disk.Read(0xFFE00), disk.Write(0xFFE00); }, "at 0xFFE00", true},
      {"behind the block", [](Disk& disk) { disk.Read(0x100200), disk.Write(0x100200); }, "at 0x100200", true},
      {"to another place", [](Disk& disk) { disk.Read(0), disk.Write(); }, "1 forbidden", false},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.name);
    Simulation machine(DiskText());
    Disk disk(machine);
    c.act(disk);
    const std::string state = machine.HardwareState();
    EXPECT_THAT(state, HasSubstr(c.told));
    const std::string content = state.substr(state.find("disk first content"), 40);
    EXPECT_EQ(machine.InitialState().find(content) != std::string::npos, c.contentStays);
  }
}

TEST(SimulatedDisk, TakesOnlyWholeSectorsAndEndsARequestWhoseThreadIsEnded) {
  Simulation machine(DiskText("latency_us = 400000"));
  Disk disk(machine);
  EXPECT_FALSE(disk.handle->Seek(0x100001));
  EXPECT_EQ(disk.handle->Read(disk.block->Bytes().first(100)), 0U);
  EXPECT_EQ(disk.handle->Read(disk.block->Bytes().subspan(8, 512)), 0U);
  Threads& threads = machine.TheMachine().threads;
  const ThreadHandle reader = threads.Start("reader", [&] { disk.Read(); });
  machine.Time().SleepFor(100'000);
  EXPECT_TRUE(machine.Panel().IsLit("first"));
  threads.Terminate(reader);
  machine.Time().SleepFor(31'000);
  EXPECT_FALSE(machine.Panel().IsLit("first"));
}

TEST(SimulatedFloppy, LightsTheSelectedDriveWhoseMotorRunsOutOfReset) {
  Bench bench(
      "[[chip]]\nname = \"fdc\"\nkind = \"floppy-controller\"\n"
      "[[led]]\nname = \"fdc\"\nsymbol = \"s\"\ncolor = \"green\"\ndevice = \"fdc\"\npin = \"motor-a\"\n");
  for (const auto& [value, lit] :
       {std::pair{0x1C, true}, {0x18, false}, {0x0C, false}, {0x1D, false}, {0x00, false}}) {
    bench.Out(0x3F2, static_cast<std::uint8_t>(value));
    EXPECT_EQ(bench.IsLit("fdc"), lit) << value;
    EXPECT_EQ(bench.In(0x3F4), (value & 4) != 0 ? 0x80 : 0);
  }
}

}  // namespace
}  // namespace panelglow::platform::sim
