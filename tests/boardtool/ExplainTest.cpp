// What "explain" says of a board.
#include <gtest/gtest.h>

#include "boardtool/Explain.h"
#include "boardtool/Rehearsal.h"
#include "platform/sim/Simulation.h"

namespace panelglow::boardtool {
namespace {

const BoardFiles kNames = BoardFilesIn(".");

std::vector<IniOutline> Files(const std::string& detect, const std::string& test, const std::string& chip) {
  return {{kNames.detectPath, detect}, {kNames.testPath, test}, {kNames.chipPath, chip}};
}

std::string ExplainedLed(const std::vector<IniOutline>& files, const char* led) {
  platform::sim::Simulation machine("");
  RehearsalWish wish;
  wish.led = FindBoardLed(led);
  return ExplainText(Rehearse(files, kNames, "7D10", platform::TheHost(), wish), files, false);
}

TEST(Explain, TellsEachRequestAndTheLineThatItComesFrom) {
  const std::vector<IniOutline> files =
      Files("[7D10]\nplatform=generic\nchips=g_memoryspace\n",
            "[7D10]\ntest.chargeled.chip=g_memoryspace\nchip.g_memoryspace.chargeled.red.deassert.sequence=16:0xF0\n",
            "[g_memoryspace]\nbase=lamps\n[lamps]\nchargeled.red.assert.sequence=16:8,17:1\n");
  EXPECT_EQ(
      ExplainedLed(files, "charge-red"),
      "board 7D10: class generic  (mbdetect.ini:2 platform=generic)\n"
      "chips: g_memoryspace  (mbdetect.ini:3 chips=g_memoryspace)\n"
      "\n"
      "charge-red: charge LED, red or amber\n"
      "  chip                                                        mbtest.ini:2 test.chargeled.chip=g_memoryspace\n"
      "  save      no such thing on this board\n"
      "  blink     no such thing on this board\n"
      "  on        memory 0x00000010 is read                         chip.ini:4 chargeled.red.assert.sequence\n"
      "            memory 0x00000010 <- as read, bits 0x08 set       chip.ini:4 chargeled.red.assert.sequence\n"
      "            memory 0x00000011 is read                         chip.ini:4 chargeled.red.assert.sequence\n"
      "            memory 0x00000011 <- as read, bits 0x01 set       chip.ini:4 chargeled.red.assert.sequence\n"
      "  off       memory 0x00000010 is read                         mbtest.ini:3 "
      "chip.g_memoryspace.chargeled.red.deassert.sequence\n"
      "            memory 0x00000010 <- as read, bits 0x0F cleared   mbtest.ini:3 "
      "chip.g_memoryspace.chargeled.red.deassert.sequence\n"
      "  restore   no such thing on this board\n"
      "  It is blinked by \"on\" and \"off\" in turn.\n");
}

TEST(Explain, SaysWhyThereIsNoBoardOrNoLamp) {
  EXPECT_EQ(ExplainedLed(Files("[7D11]\n", "", "x"), "power-red").substr(0, 47),
            "board 7D10: the files select no board; a test w");
  EXPECT_EQ(ExplainedLed(Files("[7D10]\nplatform=generic\nchips=g_ec\n", "", "[g_ec]\n"), "power-red"),
            "board 7D10: cannot be built: chip.ini missing mandatory entry for EC: ec.set_pwm.cmd\n");
  const std::string dark = ExplainedLed(
      Files("[7D10]\nplatform=generic\nchips=g_iospace\n", "[7D10]\ntest.powerled.chip=g_iospace\n", "[g_iospace]\n"),
      "power-green");
  EXPECT_NE(dark.find("note: The power LED cannot be lit: the chip \"g_iospace\" (mbtest.ini, section [7D10], key "
                      "\"test.powerled.chip\") has nothing for it; without a value in [g_iospace]: powerled."),
            std::string::npos)
      << dark;
}

}  // namespace
}  // namespace panelglow::boardtool
