// The simulated machine where it meets the real one: files, interrupts, locks of other processes.
#include "platform/posix/OwnedName.h"
#include "platform/sim/Simulation.h"

#include <gmock/gmock.h>
#include <poll.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <thread>

namespace panelglow::platform::sim {
namespace {

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
