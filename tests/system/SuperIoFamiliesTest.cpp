// Whole runs on the machines whose Super-I/O has a class that knows its registers: each lamp blinks at its turn and
// is put back, however the run ends, and a wrong word or another strap leaves it dark.
#include <gmock/gmock.h>

#include "system/LampRuns.h"

namespace panelglow::systemtest {
namespace {

using ::testing::IsEmpty;

const std::vector<Board>& Boards() {
  static const std::vector<Board> kBoards = {
      {"sio-fin.toml"},
      {"sio-fin.toml",  // another class for the same registers, which takes them from the files
       "TwoColorPower",
       {{"mbdetect.ini", "chips=fin\n", "chips=fin_f71863\n"}, {"mbtest.ini", "chip=fin\n", "chip=fin_f71863\n"}}},
      {"sio-f71808.toml"},
      {"sio-f71808.toml",  // and one for a part with both modes in one register, which stays open between save and
                           // restore
       "TwoColorPower",
       {{"mbdetect.ini", "=fin_f71808a", "=fin_f71858"},
        {"mbtest.ini", "=fin_f71808a", "=fin_f71858"},
        {"machine.toml", "base = 0x2E", "base = 0x4E"},
        {"machine.toml", "= 0x0A", "= 0x01"},
        {"machine.toml", "register = 0xF8", "register = 0xF9"}}},
      {"sio-ite-old.toml"},
      {"sio-it8721.toml", "TwoColorPower", {}, 7},  // the other colour flashes for 4 us: nobody sees that
      {"sio-win.toml", "Default"},
      {"sio-nct5571.toml"},
      {"sio-wpcd376.toml"},
      {"sio-lpc47.toml"},
      {"sio-sch5327.toml"},
      {"sio-smsc5407.toml", "Default"},
      {"sio-smsc5407.toml", "Default", {{"machine.toml", "base = 0x4E", "base = 0x2E"}}},  // both places are tried
      {"sio-vt1211.toml", "Default"},
      {"sio-vt1211.toml", "Default", {{"machine.toml", "base = 0x2E", "base = 0x4E"}}},
  };
  return kBoards;
}

TEST(SystemSuperIoFamilies, EveryLampBlinksAtItsTurnAndIsPutBack) {
  for (const Board& board : Boards()) {
    ExpectLampsBlink(board);
  }
}

TEST(SystemSuperIoFamilies, ARunThatIsStoppedWhileALampBlinksPutsItBack) {
  for (const Board& board : Boards()) {
    ExpectStoppedRunsPutBack(board);
  }
}

TEST(SystemSuperIoFamilies, TheStatusIndicatorBlinksTheGreenLamp) {
  for (const Board& board : Boards()) {
    ExpectSignal(board);
  }
}

TEST(SystemSuperIoFamilies, AWrongWordOrAnotherStrapKeepsALampFromBlinking) {
  struct Case {
    Board board;
    std::vector<std::string> still;  // lamps that do not blink
  };
  const auto word = [](const char* machine, const char* right, const char* wrong) {
    const char* const file = std::string(right).find('"') == std::string::npos ? "mbdetect.ini" : "machine.toml";
    return Board{machine, "TwoColorPower", {{file, right, wrong}}};
  };
  const std::vector<std::string> kBoth = {"power-green", "power-red"};
  const Case kCases[] = {
      {word("sio-fin.toml", "chips=fin\n", "chips=fin\nchip.fin.cfgbar=0x2E\n"), kBoth},
      {word("sio-fin.toml", "chips=fin\n", "chips=fin\nchip.fin.reg2B=0x20\n"), {"power-red"}},
      {word("sio-fin.toml", "chips=fin\n", "chips=fin\nchip.fin.reg2Ared=0xC0\n"), {"power-red"}},
      {word("sio-f71808.toml", "=fin_f71808a\n", "=fin_f71808a\nchip.fin_f71808a.cfgbar=0x4E\n"), kBoth},
      {word("sio-f71808.toml", "\"F9\" = 0x40",
            "\"F9\" = 0x40\n[[chip.lock]]\ndevice = 0x0A\nregister = 0x30\nmask = 1\nstops = [0xF9]"),
       {"power-green"}},
      {word("sio-ite-old.toml", "chips=ite\n", "chips=ite\nchip.ite.powerled.color.primary.gpio=24\n"),
       {"power-green"}},
      {word("sio-it8721.toml", "cfgbar=0x4E", "cfgbar=0x2E"), kBoth},  // and so the keys of the other place
      {word("sio-it8721.toml", "gpio=35", "gpio=36"), {"power-red"}},
      {word("sio-win.toml", "chips=win\n", "chips=win\nchip.win.cfgbar=0x2E\n"), {"power-green"}},
      {word("sio-nct5571.toml", "=nuv_nct5571\n", "=nuv_nct5571\nchip.nuvo5571.cfgbar=0x2E\n"), kBoth},
      {word("sio-nct5571.toml", "\"30\" = 0x09", "\"30\" = 0x01"), {"power-red"}},  // line 53 is not enabled
      {word("sio-wpcd376.toml", "=win_wpcd376\n", "=win_wpcd376\nchip.win_wpcd376.gpiobar=0x430\n"), kBoth},
      {word("sio-wpcd376.toml", "\"26\" = 0x00", "\"26\" = 0x80"), kBoth},  // the pins' functions are locked
      {word("sio-lpc47.toml", "chips=sio\n", "chips=sio\nchip.sio.pmbar=0x500\n"), kBoth},
      {word("sio-sch5327.toml", "=smsc_sch5327b\n", "=smsc_sch5327b\nchip.smsc_sch5327b.cfgbar=0x4E\n"), kBoth},
      {word("sio-sch5327.toml", "\"30\" = 0x01", "\"30\" = 0x00"), kBoth},  // the run-time registers do not answer
  };
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run = LedRun(Prepare(installation, c.board), c.board.section, {"-Retries=0"}, "perfect", 2);
    SCOPED_TRACE(c.board.edits.front().wrong + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, 1);
    for (const std::string& lamp : c.still) {
      EXPECT_LE(outcome.TimesLit(lamp), 1U) << lamp;  // when the other lamp's turn is over
    }
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

}  // namespace
}  // namespace panelglow::systemtest
