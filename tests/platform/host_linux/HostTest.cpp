// The host as a whole: what a start costs, and what a machine without driver, management and display answers.
#include <gtest/gtest.h>
#include <sched.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <thread>

#include "platform/Host.h"
#include "platform/host_linux/ChildProcess.h"
#include "platform/host_linux/LinuxDesktop.h"

namespace panelglow::platform {
namespace {

Host& host() { return TheHost(); }

int EntriesOf(const char* folder) {
  return static_cast<int>(
      std::distance(std::filesystem::directory_iterator(folder), std::filesystem::directory_iterator()));
}

// An informational request and a refused command line must start like a program that does nothing else.
TEST(HostTest, AStartThatWaitsForNothingMakesNoThreadAndOpensNothing) {
  ChildProcess child([](int) {
    const int threads = EntriesOf("/proc/self/task");
    const int descriptors = EntriesOf("/proc/self/fd");
    std::uint32_t error = 0;
    ManagementError managementError;
    host().console.SetControlHandler([](std::uint32_t) { return true; });
    host().console.Write("");
    host().clock.TickCount();
    host().files.CanRead("missing");
    host().drivers.Open("missing", error);
    host().management.Connect("ROOT\\CIMV2", managementError);
    return EntriesOf("/proc/self/task") - threads + 10 * (EntriesOf("/proc/self/fd") - descriptors);
  });
  EXPECT_EQ(child.Wait(), 0);
}

TEST(HostTest, SleepTakesAtLeastItsTimeByTheTickCounter) {
  const std::uint32_t begin = host().clock.TickCount();
  host().clock.Sleep(3);
  EXPECT_GE(host().clock.TickCount() - begin, 2U);  // both ends are cut to milliseconds
}

TEST(HostTest, AProcessorLeafThatIsNotThereReadsAsZero) {
  const CpuidRegisters missing = host().cpu.Cpuid(0x7FFFFFFF);
  EXPECT_EQ(missing.eax | missing.ebx | missing.ecx | missing.edx, 0U);
#if defined(__x86_64__)
  EXPECT_GE(host().cpu.Cpuid(0).eax, 1U);
  EXPECT_TRUE(host().cpu.Is64BitSystem());
#endif
}

// Registers of one processor are read by a thread that was put there.
TEST(HostTest, AThreadRunsWhereItIsPutAndNoOtherMoves) {
  const std::uint64_t before = host().cpu.Affinity();
  ASSERT_NE(before, 0U);
  std::thread([before] {
    for (unsigned cpu = 0; cpu < 64; ++cpu) {
      const std::uint64_t mask = before & std::uint64_t{1} << cpu;
      EXPECT_EQ(host().cpu.SetAffinity(mask), mask != 0) << cpu;
      EXPECT_TRUE(mask == 0 || (host().cpu.Affinity() == mask && ::sched_getcpu() == static_cast<int>(cpu))) << cpu;
    }
  }).join();
  EXPECT_EQ(host().cpu.Affinity(), before);
}

TEST(HostTest, WithoutADisplayEveryWindowFailsAndNoLoopWaits) {
  ::setenv("DISPLAY", "", 1);
  posix::LazyDrawing drawing;
  host_linux::LinuxDesktop desktop(drawing);
  ::testing::internal::CaptureStderr();
  EXPECT_TRUE(desktop.RegisterWindowClass({"Window", 0, 0, 0, {}}));
  WindowRequest request;
  request.className = "Window";
  EXPECT_EQ(desktop.CreateWindow(request), 0U);
  EXPECT_EQ(desktop.CreateWindow(request), 0U);
  Message message;
  EXPECT_FALSE(desktop.GetMessage(message));
  const std::string told = ::testing::internal::GetCapturedStderr();
  EXPECT_NE(told.find("no window can be shown, since the environment variable DISPLAY names no display."),
            std::string::npos);
  EXPECT_EQ(std::count(told.begin(), told.end(), '\n'), 1);
}

}  // namespace
}  // namespace panelglow::platform
