// Southbridge classes against simulated silicon: what a list of requests cannot tell.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "board/BoardBench.h"
#include "board/chips/southbridge/IchChip.h"
#include "board/chips/southbridge/Sb710Chip.h"

namespace panelglow {
namespace {

std::string MachineFile(const std::string& name) {
  std::ostringstream text;
  text << std::ifstream(PANELGLOW_SOURCE_DIR "/machines/" + name).rdbuf();
  return text.str();
}

// A press that was latched before is forgotten; all else is as it was.
TEST(IchSilicon, TheArmedPowerButtonForgetsAnOldPress) {
  BoardBench bench(MachineFile("ich-desktop.toml"));
  IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  IchChip chip;
  EXPECT_TRUE(chip.SavePowerButtonState());
  EXPECT_TRUE(chip.ArmPowerButton());
  bool pressed = true;
  EXPECT_TRUE(chip.IsPowerButtonPressed(pressed));
  EXPECT_FALSE(pressed);
  EXPECT_NE(bench.machine.HardwareState().find("port F803 = 00"), std::string::npos);
  EXPECT_TRUE(chip.RestorePowerButtonState());
  std::string before = bench.machine.InitialState();
  const std::string latched = "port F801 = 01";
  before.replace(before.find(latched), latched.size(), "port F801 = 00");
  EXPECT_EQ(bench.machine.HardwareState(), before);
}

TEST(SbxSilicon, LinesAreReadThroughTheDoorwayToConfigurationSpace) {
  BoardBench bench(
      "[[pci]]\ndevice = 0x14\n[pci.registers]\n"
      "\"50\" = 0x02000400\n\"80\" = 0x00000800\n\"A4\" = 0x08000000\n\"A8\" = 0x04800000\n");
  IniReader::Instance("7D10", ".\\mbdetect.ini", ".\\mbtest.ini", ".\\chip.ini");
  SbxChip sbx;
  Sb710Chip sb710;
  const std::pair<int, int> kSbx[] = {{0, 4}, {3, 3}, {9, 4}, {10, 3}, {11, 4}, {12, 3}, {50, 4}, {51, 3}};
  for (const auto& [line, level] : kSbx) {
    EXPECT_EQ(sbx.ReadLine(line), level) << line;
  }
  const std::pair<int, int> kSb710[] = {{45, 4}, {48, 3}, {53, 4}, {54, 3}};
  for (const auto& [line, level] : kSb710) {
    EXPECT_EQ(sb710.ReadLine(line), level) << line;
  }
  EXPECT_EQ(bench.machine.HardwareState(), bench.machine.InitialState());
}

}  // namespace
}  // namespace panelglow
