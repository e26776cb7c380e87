// Whole runs on the board classes that know their chips, and on southbridges and what hangs on their buses: each lamp
// blinks at its turn and is put back, however the run ends, and a wrong word or strap leaves it as it is.
#include <gmock/gmock.h>

#include "system/LampRuns.h"

namespace panelglow::systemtest {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;

// A machine whose section names a board class in place of the generic one with this chip. Where the class presets the
// chip of the lamp, the section need not.
Board Classed(const std::string& machine, const std::string& boardClass, const std::string& chip, bool isPreset,
              const std::string& section = "TwoColorPower") {
  Board board{machine, section, {{"mbdetect.ini", "=generic\nchips=" + chip + "\n", "=" + boardClass + "\n"}}};
  if (isPreset) {
    board.edits.push_back({"mbtest.ini", "test.powerled.chip=" + chip + "\n", ""});
  }
  return board;
}

// The class "cbb" goes by the system id. `edits` are the machine's.
Board Cbb(const std::string& machine, const std::string& chip, const std::string& genericId, const std::string& id,
          const std::string& section = "TwoColorPower", const std::vector<Edit>& edits = {}) {
  Board board = Classed(machine, "cbb", chip, true, section);
  for (const char* file : {"machine.toml", "mbdetect.ini", "mbtest.ini"}) {
    board.edits.push_back({file, genericId, id});
  }
  board.edits.insert(board.edits.end(), edits.begin(), edits.end());
  return board;
}

// One that has MotherboardClass in place of platform.
Board Oldest(const std::string& machine, const std::string& boardClass, const std::string& chip,
             const std::string& section) {
  return {
      .machine = machine,
      .section = section,
      .edits = {{"mbdetect.ini", "platform=generic\nchips=" + chip + "\n", "MotherboardClass=" + boardClass + "\n"}},
      .hasSignal = false};
}

// The status indicator cannot use a part that only blinks by itself, and the classes of the oldest boards.
const std::vector<Board>& Boards() {
  static const std::vector<Board> kBoards = {
      {"ich-desktop.toml"},
      {"ich-desktop.toml",  // a colour's line in another register
       "TwoColorPower",
       {{"mbtest.ini", "secondary=24", "secondary=33"}, {"machine.toml", "0F.0", "38.1"}}},
      {"ich-desktop.toml",  // a class that has the lamp from the one it comes from
       "TwoColorPower",
       {{"mbdetect.ini", "chips=ich\n", "chips=hudson\n"}, {"mbtest.ini", "chip=ich\n", "chip=hudson\n"}}},
      {"bench-desktop.toml"},  // beside much else
      Classed("sio-wpcd376.toml", "ich_win", "win_wpcd376", true),
      Classed("sio-lpc47.toml", "sb7sch5", "sio", true),
      Classed("sio-ite-old.toml", "mistral", "ite", true),
      Classed("sio-lpc47.toml", "cobble", "sio", false),
      Classed("ich-desktop.toml", "cobble", "ich", false),
      Cbb("sio-fin.toml", "fin", "7CA0", "0B1C"),
      Cbb("sio-fin.toml", "fin", "7CA0", "0B38"),
      Cbb("sio-win.toml", "win", "7CA4", "0B34", "Default"),
      Cbb("sio-win.toml", "win", "7CA4", "0B44", "Default",
          {{"machine.toml", "mask = 0xC0\nhigh = [0x00]\nblinks = { \"80\" = 500, \"C0\" = 2000 }",
            "mask = 0x20\nhigh = [0x00]"},
           {"machine.toml", "\"F3\" = 0x40", "\"F3\" = 0x29"}}),
      {.machine = "smbus-desktop.toml", .hasSignal = false},
      Oldest("sio-wpcd376.toml", "Orchard", "win_wpcd376", "TwoColorPower"),
      {.machine = "orchard-desktop.toml", .hasSignal = false},
      {.machine = "saddle-desktop.toml", .section = "Default", .hasSignal = false},
  };
  return kBoards;
}

TEST(SystemBoardClasses, EveryLampBlinksAtItsTurnAndIsPutBack) {
  for (const Board& board : Boards()) {
    ExpectLampsBlink(board);
  }
}

TEST(SystemBoardClasses, ARunThatIsStoppedWhileALampBlinksPutsItBack) {
  for (const Board& board : Boards()) {
    ExpectStoppedRunsPutBack(board);
  }
}

TEST(SystemBoardClasses, TheStatusIndicatorBlinksTheGreenLampOfABoardThatItCanUse) {
  for (const Board& board : Boards()) {
    ExpectSignal(board);
  }
}

TEST(SystemBoardClasses, AWrongWordOrAnIllPartKeepsTheGreenLampFromBlinking) {
  struct Case {
    const char* machine;
    Edit edit;
    const char* told = "";
  };
  const Case kCases[] = {
      {"ich-desktop.toml", {"mbdetect.ini", "chips=ich\n", "chips=ich\nchip.ich.gpiobar=0xF000\n"}},
      {"ich-desktop.toml", {"machine.toml", "\"01\" = 0x31", "\"01\" = 0x21"}},  // the line serves another function
      {"ich-desktop.toml", {"machine.toml", "\"05\" = 0x2F", "\"05\" = 0x3F"}},  // the line is an input
      {"ich-desktop.toml", {"mbtest.ini", "primary=12", "primary=96"}, "cannot be lit"},
      {"smbus-desktop.toml", {"mbdetect.ini", "saddr=0x58", "saddr=0x2C"}, "cannot be lit"},  // not shifted
      {"smbus-desktop.toml", {"mbtest.ini", "03:0xC4", "07:0xC4"}, "cannot be lit"},
      {"smbus-desktop.toml", {"machine.toml", "= 0x5000", "= 0x5000\nfault = \"stuck-busy\""}, "cannot be lit"},
      {"saddle-desktop.toml", {"machine.toml", "base = 0x4E", "base = 0x2E"}},
      // This class leaves the lighting to a chip, and has none.
      {"sio-win.toml",
       {"mbdetect.ini", "platform=generic\nchips=win\n", "MotherboardClass=Lantern\n"},
       "the board class Lantern has no chip \"win\""},
  };
  for (const Case& c : kCases) {
    const Installation installation;
    const Board board{c.machine, "Default", {c.edit}};
    const SimulatedRun run = LedRun(Prepare(installation, board), board.section, {"-Retries=0"}, "perfect", 2);
    SCOPED_TRACE(board.Name() + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_THAT(outcome.Tagged("ReportFailure"), ::testing::ElementsAre("ReportFailure 770133"));
    EXPECT_EQ(outcome.TimesLit("power-green"), 0U);
    EXPECT_THAT(outcome.errors, HasSubstr(c.told));
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

}  // namespace
}  // namespace panelglow::systemtest
