// The simulated machine: its file, its buses, its panel.
#include "platform/posix/OwnedName.h"
#include "platform/sim/Simulation.h"

#include <gmock/gmock.h>
#include <poll.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <thread>

#include "platform/sim/person/Operator.h"

namespace panelglow::platform::sim {
namespace {

using ::testing::HasSubstr;

constexpr const char* kPanel = R"(
[[chip]]
name = "gpio"
kind = "gpio-block"
base = 0xA20
outputs = 0x03
inputs = 0x30
[[led]]
name = "power"
symbol = "power"
color = "green"
device = "gpio"
pin = "0"
[[led]]
name = "low"
symbol = "charge"
color = "red"
device = "gpio"
pin = "1"
active_low = true
)";

constexpr const char* kTwoOfOneName = R"([[led]]
name = "power"
symbol = "power"
color = "green"
device = "keyboard"
pin = "caps-lock"

[[led]]
# line 9
symbol = "power"
color = "green"
device = "keyboard"
pin = "num-lock"
name = "power"
)";

TEST(Simulation, AMistakeInAMachinesFileIsNamedWithItsLine) {
  struct Case {
    const char* text;
    const char* problem;
  };
  const Case kCases[] = {
      {"name = ", "machine:1: "},
      {"nmae = \"x\"", "machine:1: \"nmae\" is not a key"},
      {"\n[[chip]]\nname = \"a\"", "machine:2: \"chip.kind\" is missing"},
      {"[[chip]]\nname = \"a\"\nkind = \"toaster\"", "there is no kind \"toaster\""},
      {"[[chip]]\nname = \"a\"\nkind = \"gpio-block\"\nbase = \"x\"", "machine:4: \"chip.base\" has the wrong type"},
      {"[[chip]]\nname = \"a\"\nkind = \"memory-registers\"\ninitial = [256]", "machine:4: "},
      {"[[led]]\nname = \"a\"\nsymbol = \"b\"\ncolor = \"c\"\ndevice = \"none\"\npin = \"0\"", "no pin \"0\""},
      {kTwoOfOneName, "machine:14: \"led.name\" is the name of another one, too: \"power\""},
      {"chip = [{name = \"a\", kind = \"legacy-panel\"}, {name = \"a\", kind = \"legacy-panel\"}]",
       "\"chip.name\" is the name of another one"},
      {"driver = {refused = [-1]}", "\"driver.refused\" holds a value that is no number of 32 bits"},
      {"driver = {msr = {\"1G\" = 1}}", "\"driver.msr\" holds hexadecimal addresses"},
      {"[[event]]\nat_ms = 5", "\"event.console\" is missing"},
      {"[pci]\n[pci.registers]\n3 = 1", "a PCI register is"},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.text);
    try {
      const Simulation machine(c.text);
      ADD_FAILURE() << "accepted";
    } catch (const MachineError& error) {
      EXPECT_THAT(error.what(), HasSubstr(c.problem));
    }
  }
}

TEST(Simulation, ThePanelShowsWhatTheRegistersDriveAndKeepsEveryChange) {
  Simulation machine(kPanel);
  EXPECT_FALSE(machine.Panel().IsLit("power"));
  EXPECT_TRUE(machine.Panel().IsLit("low"));
  machine.Time().SleepFor(1000);
  machine.Hardware().WritePort(0xA20, 1, 0x31);
  machine.Panel().Update(machine.Time().Now());
  EXPECT_EQ(machine.Hardware().ReadPort(0xA21, 1), 0x31);  // input pins read from outside
  machine.Hardware().WritePort(0xA20, 1, 0x02);
  machine.Panel().Update(machine.Time().Now());
  EXPECT_EQ(machine.Hardware().ReadPort(0xA21, 1), 0x32);
  std::string line;
  for (const LedChange& change : machine.Panel().TimeLine()) {
    line += machine.Panel().Leds()[change.led].name + (change.lit ? "+" : "-") + std::to_string(change.time) + " ";
  }
  EXPECT_EQ(line, "low+0 power+1000 power-1000 low-1000 ");
  EXPECT_NE(machine.HardwareState(), machine.InitialState());
}

TEST(Simulation, AnImpossibleFaultIsRefused) {
  Simulation machine(kPanel);
  for (const auto& [led, fault] :
       {std::pair{"none", "dead"}, std::pair{"power", "wet"}, std::pair{"power", "swapped"},
        std::pair{"power", "shorted:power"}, std::pair{"power", "swapped:none"}}) {
    EXPECT_THROW(machine.Break(led, fault), MachineError) << led << " " << fault;
  }
  machine.Break("power", "swapped:low");
  EXPECT_TRUE(machine.Panel().IsLit("power"));
  EXPECT_FALSE(machine.Panel().IsLit("low"));
}

TEST(Simulation, AnOperatorThatDoesNotExistIsRefused) {
  Simulation machine("");
  for (const char* policy : {"", "perfekt", "wrong:x", "script:/no/such/file"}) {
    EXPECT_THROW(Operator(machine.Seat(), {}, policy), MachineError) << policy;
  }
}

TEST(Simulation, ASimulatedDriveRootNeverReachesTheRealSystem) {
  Simulation machine("", {.realFiles = true});
  Files& files = machine.TheMachine().files;
  EXPECT_FALSE(files.CanRead("\\etc\\passwd"));
  EXPECT_TRUE(files.Write("\\panelglow-test.ctl", "x"));
  EXPECT_EQ(files.Read("\\panelglow-test.ctl"), "x");
  EXPECT_FALSE(std::filesystem::exists("/panelglow-test.ctl"));
  EXPECT_FALSE(files.CanRead("C:\\ProgramData\\x"));
}

TEST(Simulation, AnInterruptThatComesBeforeTheProgramListensIsHeardOnceItDoes) {
  std::vector<std::uint32_t> heard;
  {
    Simulation machine("", {.captureOutput = false});
    std::raise(SIGINT);
    machine.Time().SleepFor(1000);
    machine.TheMachine().console.SetControlHandler([&](std::uint32_t type) {
      heard.push_back(type);
      return true;
    });
    machine.Time().SleepFor(1000);
  }
  for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
    std::signal(number, SIG_DFL);
  }
  EXPECT_EQ(heard, std::vector<std::uint32_t>{kControlC});
}

// The files of the current folder are real, and so are the other processes that use them.
TEST(SimulatedMachine, LocksOfRealFilesHoldAmongProcesses) {
  SimulationOptions options;
  options.realFiles = true;
  Simulation machine(MachineDescription{}, options);
  platform::NamedMutexes& mutexes = machine.TheMachine().mutexes;
  const std::string name = "test" + std::to_string(::getpid()) + "_HalcyonFileParser";
  const posix::OwnedName other(name);
  posix::Descriptor owned = other.TryToOwn();
  ASSERT_TRUE(owned);
  std::atomic<bool> released{false};
  std::thread otherProcess([&] {
    pollfd waiter{owned.Get(), POLLIN, 0};
    ::poll(&waiter, 1, -1);  // until the machine waits for it
    released = true;
    owned.Close();
  });
  {
    const platform::NamedMutexLock lock(mutexes, name);
    EXPECT_TRUE(released);
    EXPECT_FALSE(other.TryToOwn());
    const platform::NamedMutexLock again(mutexes, name);
  }
  otherProcess.join();
  EXPECT_TRUE(other.TryToOwn());
}

}  // namespace
}  // namespace panelglow::platform::sim
