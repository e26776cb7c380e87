// The temperatures that processors and graphics cards tell.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "board/ChipCases.h"
#include "board/base/SelectedSystem.h"
#include "board/chips/sensor/AcpiChip.h"
#include "board/chips/sensor/VideoChip.h"
#include "harness/base/CDMException.h"
#include "platform/Host.h"

namespace panelglow {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

class TemperatureBench : public KeyBench {
 public:
  TemperatureBench(const std::string& hardware, const std::string& settings,
                   SelectedSystem processor = {"Intel", 6, "", ""})
      : KeyBench(hardware, settings) {
    SetSelectedSystem(std::move(processor));
  }
};

// Two processors with two cores each, none hotter than 100 degrees.
constexpr const char* kFourCores = R"(
[[firmware.processor]]
[[firmware.processor]]
[driver.msr]
"1A2" = 0x641234
[[driver.core]]
msr = { 19C = 0x280000 }
[[driver.core]]
msr = { 19C = 0xFF2B0000 }
[[driver.core]]
msr = { 19C = 0x0A0000 }
[[driver.core]]
msr = { 19C = 0x0B0000 }
)";

// The list's first entry is another maker's, the second another family, the third this machine's.
constexpr const char* kList =
    "test.tempcaution.processor.1.manufacturer=AMD\ntest.tempcaution.processor.1.familyid=6\n"
    "test.tempcaution.processor.2.manufacturer=Intel\ntest.tempcaution.processor.2.familyid=15\n"
    "test.tempcaution.processor.3.manufacturer=Intel\ntest.tempcaution.processor.3.familyid=0x06\n"
    "test.tempcaution.processor.3.mechanism=msr\n";

TEST(AcpiChip, ReadsEachCoreOfAProcessorOnThatCore) {
  TemperatureBench bench(kFourCores, kList);
  AcpiChip chip;
  int value = -7;
  EXPECT_TRUE(chip.ReadThreshold(0, value));
  EXPECT_EQ(value, 100);
  EXPECT_TRUE(chip.ReadProcessorTemperature(0, value, false, "CPU"));
  EXPECT_EQ(value, 60);
  EXPECT_THAT(chip.GetCoreTemperatures(), IsEmpty());
  bench.machine.ClearOutput();
  EXPECT_TRUE(chip.ReadProcessorTemperature(0, value, true, "CPU"));
  EXPECT_EQ(value, 58);  // 58.5
  EXPECT_THAT(chip.GetCoreTemperatures(), ElementsAre(60, 57));
  EXPECT_THAT(bench.machine.Output(), HasSubstr("Temperature for the processor :0 and core number :1 is 57 "));
  EXPECT_THAT(bench.machine.Output(), HasSubstr("Average Temperature for the processor number :0 is 58 "));
  EXPECT_TRUE(chip.ReadProcessorTemperature(1, value, true, "CPU"));
  EXPECT_EQ(value, 89);  // 90 and 89
  value = -7;
  for (const int zone : {2, -1, 64, 0x7FFFFFFF}) {
    EXPECT_FALSE(chip.ReadProcessorTemperature(zone, value, true, "CPU")) << zone;
  }
  EXPECT_EQ(value, -7);
  EXPECT_EQ(platform::TheHost().cpu.Affinity(), 15U);
}

TEST(AcpiChip, SaysWhatItCannotRead) {
  struct Case {
    std::string settings;
    const char* hardware;
    bool throws;
    const char* told;
  };
  const std::string ofThis =
      "test.tempcaution.processor.1.manufacturer=Intel\ntest.tempcaution.processor.1.familyid=6\n";
  const Case kCases[] = {
      {"", kFourCores, false, ""},
      {ofThis, kFourCores, false, ""},
      {ofThis + "test.tempcaution.processor.1.mechanism=mrs\n", kFourCores, false, "\"mrs\" is no way to read"},
      {std::string(kList) + "test.tempcaution.processor.3.maxtempreg=0x1A3\n", kFourCores, true, ""},
      {kList, "driver.link = false\n", false, ""},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.settings + c.hardware);
    TemperatureBench bench(c.hardware, c.settings);
    AcpiChip chip;
    int value = -7;
    for (const bool threshold : {true, false}) {
      try {
        EXPECT_FALSE(threshold ? chip.ReadThreshold(0, value) : chip.ReadProcessorTemperature(0, value, true, ""));
        EXPECT_FALSE(c.throws);
      } catch (const CDMException& missing) {
        EXPECT_TRUE(c.throws);
        EXPECT_EQ(missing.code, 990700);
      }
    }
    EXPECT_EQ(value, -7);
    EXPECT_THAT(bench.machine.Errors(), HasSubstr(c.told));
    EXPECT_EQ(*c.told == '\0', bench.machine.Errors().find("temperature") == std::string::npos);
    EXPECT_EQ(platform::TheHost().cpu.Affinity(), bench.machine.Description().driver.cores.empty() ? 1U : 15U);
  }
}

// Each AMD processor has a northbridge of its own; the oldest kind keeps its sensor elsewhere.
TEST(AcpiChip, ReadsAnAmdProcessorInItsNorthbridge) {
  constexpr const char* kNorthbridges = R"(
[[pci]]
device = 0x18
function = 2
registers = { 0 = 0x12021022, 8 = 0x06000000, A4 = 0x11000000 }
[[pci]]
device = 0x18
function = 3
registers = { 0 = 0x12031022, 8 = 0x06000000, A4 = 0x34FFFFFF, E4 = 0x11000000 }
[[pci]]
device = 0x19
function = 3
registers = { 0 = 0x11031022, 8 = 0x06000000, A4 = 0x11000000, E4 = 0x2A000000 }
)";
  TemperatureBench bench(kNorthbridges,
                         "test.tempcaution.processor.1.manufacturer=AMD\ntest.tempcaution.processor.1.familyid=16\n"
                         "test.tempcaution.processor.1.mechanism=pci\n",
                         {"AMD", 16, "", ""});
  AcpiChip chip;
  int value = 0;
  EXPECT_TRUE(chip.ReadProcessorTemperature(0, value, true, ""));
  EXPECT_EQ(value, 0x34);
  EXPECT_THAT(chip.GetCoreTemperatures(), IsEmpty());
  EXPECT_THAT(bench.machine.Output(), HasSubstr("AMD processor detected, ignoring the Core temperature reading."));
  EXPECT_TRUE(chip.ReadProcessorTemperature(1, value, false, ""));
  EXPECT_EQ(value, 0x2A);
  EXPECT_FALSE(chip.ReadProcessorTemperature(2, value, false, ""));
  EXPECT_FALSE(chip.ReadProcessorTemperature(8, value, false, ""));
  EXPECT_FALSE(chip.ReadThreshold(0, value));
}

TEST(VideoChip, ReadsEachCardThroughItsMakersLibrary) {
  const std::string kCards = R"(
[[pci]]
device = 1
registers = { 0 = 0x1C0310DE, 8 = 0x03000000, 2C = 0x61603842 }
temperatures = [40]
[[pci]]
device = 2
registers = { 0 = 0x68B81002, 8 = 0x03000000 }
temperatures = [50, 55, 60]
[[pci]]
device = 3
registers = { 0 = 0x1C0310DE, 8 = 0x03000000, 2C = 0x99993842 }
temperatures = [41]
[[pci]]
device = 4
registers = { 0 = 0x01668086, 8 = 0x03000000 }
)";
  const std::string table =
      "test.graphics.1.PCI_IDS=1002\ntest.graphics.2.PCI_IDS=1002 68B8\ntest.graphics.2.Temp_Zones=2\n"
      "test.graphics.2.Upper_Threshold=95\ntest.graphics.3.PCI_IDS=10DE 1C03 3842 9999\n"
      "test.graphics.3.Upper_Threshold=90\ntest.graphics.3.Lower_Threshold=5\n";
  {
    TemperatureBench bench("libraries = ['atiadlxy.dll', 'NVAPI.dll']\n" + kCards, table);
    VideoChip chip;
    ASSERT_EQ(chip.CountCards(), 4);
    const int kNone = -7;
    const int kExpected[][4] = {// zone, temperature, upper and lower limit
                                {0, 40, kNone, kNone},    {1, 55, 95, kNone},       {2, 41, 90, 5},
                                {3, kNone, kNone, kNone}, {4, kNone, kNone, kNone}, {-1, kNone, kNone, kNone}};
    for (const auto& [zone, temperature, upper, lower] : kExpected) {
      SCOPED_TRACE(zone);
      int value = kNone;
      EXPECT_EQ(chip.ReadTemperature(zone, value), temperature != kNone);
      EXPECT_EQ(value, temperature);
      value = kNone;
      EXPECT_EQ(chip.ReadThreshold(zone, value), upper != kNone);
      EXPECT_EQ(value, upper);
      value = kNone;
      EXPECT_EQ(chip.ReadLowLimitTemperature(zone, value), lower != kNone);
      EXPECT_EQ(value, lower);
    }
    EXPECT_THAT(bench.machine.Errors(), HasSubstr("\"1002\" does not say which card"));
  }
  TemperatureBench bare(kCards, "");
  VideoChip chip;
  int value = 0;
  EXPECT_FALSE(chip.ReadTemperature(0, value));
  EXPECT_FALSE(chip.ReadTemperature(1, value));
  EXPECT_THAT(bare.machine.Errors(), ::testing::AllOf(HasSubstr("nvapi.dll cannot"), HasSubstr("nor atiadlxy.dll")));
  TemperatureBench none("", "");
  EXPECT_EQ(VideoChip().CountCards(), 0);
  EXPECT_THAT(none.machine.Output(),
              HasSubstr("No Video Card information found in the System !!!! WMI Query Failed."));
}

}  // namespace
}  // namespace panelglow
