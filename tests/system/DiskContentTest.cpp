// A disk that lives in a real file: no byte of it changes, also when the program is killed.
#include <gmock/gmock.h>

#include <cstdint>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

constexpr std::size_t kDiskBytes = 0x200000;
constexpr const char* kDisk = R"(
[[controller]]
name = "sata"
id = 'PCI\VEN_8086&DEV_A282&SUBSYS_7D108086&REV_00\3&11583659&0&B8'
driver = "storahci"
[[disk]]
name = "disk"
controller = "sata"
id = 'IDE\DISK\5&1&0&0.0.0'
file = "disk.img"
size = 0x200000
latency_us = 4000
[[led]]
name = "drive"
symbol = "drive"
color = "green"
device = "disk"
pin = "activity"
)";

std::string Content() {
  std::string content(kDiskBytes, '\0');
  std::uint32_t word = 1;
  for (char& byte : content) {
    word = word * 1664525U + 1013904223U;
    byte = static_cast<char>(word >> 24U);
  }
  return content;
}

Outcome SilentRun(const Installation& installation, const std::string& event = {}) {
  installation.Write("disk.img", Content());
  const SimulatedRun run{installation.Machine("desktop.toml", kDisk + event),
                         "silent",
                         1,
                         {},
                         {"-subtest=LEDTest", "-HDDOnControllers=all", "-Retries=0", "-LEDTimeout=10"}};
  return run.In(installation);
}

// In the middle of each request of two passes over the block, a read and a write of four milliseconds each, at two
// moments; and in the dark.
TEST(SystemDisk, IsAsItWasWhenTheProgramIsKilledInTheMiddleOfItsTraffic) {
  const std::string content = Content();
  const Installation installation;
  const Outcome whole = SilentRun(installation);
  std::uint64_t lit_ms = 0;
  for (const Edge& edge : whole.edges) {
    lit_ms = edge.led == "drive" && edge.lit && lit_ms == 0 ? edge.time_us / 1000 : lit_ms;
  }
  ASSERT_GT(lit_ms, 0U) << whole.output << whole.errors;
  for (const std::uint64_t after_ms : {1U, 3U, 5U, 7U, 9U, 11U, 13U, 15U, 700U}) {
    const std::uint64_t moment_ms = lit_ms + after_ms;
    SCOPED_TRACE(moment_ms);
    const Outcome killed =
        SilentRun(installation, "[[event]]\nat_ms = " + std::to_string(moment_ms) + "\nkill = true\n");
    EXPECT_EQ(killed.exitCode, -1);
    EXPECT_EQ(killed.end_us, 0U);
    EXPECT_TRUE(installation.Read("disk.img") == content);
  }
}

}  // namespace
}  // namespace panelglow::systemtest
