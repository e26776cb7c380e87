// Whole runs on machines whose power lamp hangs on a Super-I/O, a southbridge or what stands on its buses, and on the
// oldest boards: each lamp blinks at its turn and is put back, however the run ends, and a wrong word, another strap
// or an ill part keeps it from blinking.
#include <gmock/gmock.h>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;

/// Every occurrence of a text in a file of the installation, or in the machine's, which is "machine.toml".
struct Edit {
  std::string file;
  std::string right;
  std::string wrong;
};

struct Board {
  std::string machine;
  std::string section = "TwoColorPower";  // "Default": the lamp has one colour
  std::vector<Edit> edits = {};
  unsigned furtherSeed = 2;
  bool hasSignal = true;  // the status indicator can light and darken the lamp

  /// Which it is, for a failure's text: its machine, and what is edited in few words.
  [[nodiscard]] std::string Name() const {
    std::string name = machine;
    for (const Edit& edit : edits) {
      name += edit.wrong.find('\n') + 1 < edit.wrong.size() ? "" : ", " + edit.wrong;
    }
    return name;
  }
};

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
      // Southbridges and board classes; the status indicator cannot use a part that only blinks by itself, and the
      // classes of the oldest boards.
      {"ich-desktop.toml"},
      {"ich-desktop.toml",  // a colour's line in another register
       "TwoColorPower",
       {{"mbtest.ini", "secondary=24", "secondary=33"}, {"machine.toml", "0F.0", "38.1"}}},
      {"ich-desktop.toml",  // a class that has the lamp from the one it comes from
       "TwoColorPower",
       {{"mbdetect.ini", "chips=ich\n", "chips=hudson\n"}, {"mbtest.ini", "chip=ich\n", "chip=hudson\n"}}},
      {"bench-desktop.toml"},  // beside much else
      {.machine = "smbus-desktop.toml", .hasSignal = false},
      {.machine = "orchard-desktop.toml", .hasSignal = false},
      {.machine = "saddle-desktop.toml", .section = "Default", .hasSignal = false},
  };
  return kBoards;
}

std::vector<std::string> LampsOf(const Board& board) {
  const bool hasRed = board.section == "TwoColorPower";
  return hasRed ? std::vector<std::string>{"power-green", "power-red"} : std::vector<std::string>{"power-green"};
}

void ExpectNothingLeft(const Outcome& outcome) {
  EXPECT_TRUE(outcome.IsOrderly());
  EXPECT_EQ(outcome.errors, "");
  EXPECT_THAT(outcome.leftBehind, IsEmpty());
  EXPECT_THAT(outcome.LeftChanged(), IsEmpty());
}

// Writes the board's files with `events` behind the machine's; the path of the latter.
std::string Prepare(const Installation& installation, const Board& board, const std::string& events = {}) {
  installation.Write("machine.toml", installation.Read(installation.Machine(board.machine)) + events);
  for (const Edit& edit : board.edits) {
    installation.Replace(edit.file, edit.right, edit.wrong);
  }
  return installation.Path("machine.toml").string();
}

TEST(SystemLamps, EveryLampBlinksAtItsTurnAndIsPutBack) {
  for (const Board& board : Boards()) {
    std::vector<unsigned> seeds = Seeds(1);
    seeds.push_back(board.furtherSeed);
    for (const unsigned seed : seeds) {
      const Installation installation;
      const SimulatedRun run = LedRun(Prepare(installation, board), board.section, {"-Retries=0"}, "slow:5", seed);
      SCOPED_TRACE(board.Name() + ": " + run.Describe());
      const Outcome outcome = run.In(installation);
      EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
      ExpectNothingLeft(outcome);
      for (const std::string& lamp : LampsOf(board)) {
        EXPECT_GE(outcome.TimesLit(lamp), 3U) << lamp;  // one of them when it is put back
      }
    }
  }
}

// Stopped from outside, at moments that fall into lit and dark phases, and by the operator.
TEST(SystemLamps, ARunThatIsStoppedWhileALampBlinksPutsItBack) {
  for (const Board& board : Boards()) {
    for (const std::string& lamp : LampsOf(board)) {
      for (const unsigned seed : Seeds(3)) {
        const Installation installation;
        const std::string button = lamp == "power-red" ? "PowerRed" : "PowerGreen";
        installation.Write("ui.xml", "<UI><Section ID=\"Lamp\"><Button ID=\"" + button + "\"/></Section></UI>");
        const std::string moment = std::to_string(3500 + 370 * seed);
        const bool byOperator = seed % 3 == 0;
        const SimulatedRun run =
            LedRun(Prepare(installation, board,
                           byOperator ? "" : "\n[[event]]\nat_ms = " + moment + "\nwrite_file = '\\kill.ctl'\n"),
                   "Lamp", {"-Retries=0"}, byOperator ? "cancel" : "silent", seed);
        SCOPED_TRACE(board.Name() + (": " + moment + " ms: " + run.Describe()));
        const Outcome outcome = run.In(installation);
        EXPECT_EQ(outcome.exitCode, 1);
        EXPECT_GE(outcome.TimesLit(lamp), 1U);
        ExpectNothingLeft(outcome);
      }
    }
  }
}

TEST(SystemLamps, TheStatusIndicatorBlinksTheGreenLampOrSaysThatItCannot) {
  for (const Board& board : Boards()) {
    const Installation installation;
    const SimulatedRun run{Prepare(installation, board), "", 1, {}, {"-subtest=LEDStatusIndicator", "-BlinkTime=1"}};
    SCOPED_TRACE(board.Name());
    const Outcome outcome = run.In(installation);
    if (board.hasSignal) {
      EXPECT_EQ(outcome.exitCode, 0);
      ExpectNothingLeft(outcome);
      EXPECT_GE(outcome.TimesLit("power-green"), 20U);
      continue;
    }
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.TimesLit("power-green"), 0U);
    EXPECT_TRUE(outcome.errors.find("cannot be lit") != std::string::npos ||
                !outcome.Tagged("TestFailed 990431").empty())
        << outcome.errors;
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

TEST(SystemLamps, AWrongWordAnotherStrapOrAnIllPartKeepsALampFromBlinking) {
  struct Case {
    Board board;
    std::vector<std::string> still;  // lamps that do not blink; none: the run passes
    const char* told = "";
    const char* leftBehind = nullptr;  // null: nothing is
  };
  const auto edited = [](const char* machine, const char* section, const char* file, const char* right,
                         const char* wrong) {
    return Board{machine, section, {{file, right, wrong}}};
  };
  const auto word = [&](const char* machine, const char* right, const char* wrong) {
    const char* const file = std::string(right).find('"') == std::string::npos ? "mbdetect.ini" : "machine.toml";
    return edited(machine, "TwoColorPower", file, right, wrong);
  };
  const auto single = [&](const char* machine, const char* file, const char* right, const char* wrong) {
    return edited(machine, "Default", file, right, wrong);
  };
  const std::vector<std::string> kBoth = {"power-green", "power-red"};
  const std::vector<std::string> kGreen = {"power-green"};
  const Case kCases[] = {
      {word("sio-fin.toml", "chips=fin\n", "chips=fin\nchip.fin.cfgbar=0x2E\n"), kBoth},
      {word("sio-fin.toml", "chips=fin\n", "chips=fin\nchip.fin.reg2B=0x20\n"), {"power-red"}},
      {word("sio-fin.toml", "chips=fin\n", "chips=fin\nchip.fin.reg2Ared=0xC0\n"), {"power-red"}},
      {word("sio-f71808.toml", "=fin_f71808a\n", "=fin_f71808a\nchip.fin_f71808a.cfgbar=0x4E\n"), kBoth},
      {word("sio-f71808.toml", "\"F9\" = 0x40",
            "\"F9\" = 0x40\n[[chip.lock]]\ndevice = 0x0A\nregister = 0x30\nmask = 1\nstops = [0xF9]"),
       kGreen},
      {word("sio-ite-old.toml", "chips=ite\n", "chips=ite\nchip.ite.powerled.color.primary.gpio=24\n"), kGreen},
      {word("sio-it8721.toml", "cfgbar=0x4E", "cfgbar=0x2E"), kBoth},  // and so the keys of the other place
      {word("sio-it8721.toml", "gpio=35", "gpio=36"), {"power-red"}},
      {word("sio-win.toml", "chips=win\n", "chips=win\nchip.win.cfgbar=0x2E\n"), kGreen},
      {word("sio-nct5571.toml", "=nuv_nct5571\n", "=nuv_nct5571\nchip.nuvo5571.cfgbar=0x2E\n"), kBoth},
      {word("sio-nct5571.toml", "\"30\" = 0x09", "\"30\" = 0x01"), {"power-red"}},  // line 53 is not enabled
      {word("sio-wpcd376.toml", "=win_wpcd376\n", "=win_wpcd376\nchip.win_wpcd376.gpiobar=0x430\n"), kBoth},
      {word("sio-wpcd376.toml", "\"26\" = 0x00", "\"26\" = 0x80"), kBoth},  // the pins' functions are locked
      {word("sio-lpc47.toml", "chips=sio\n", "chips=sio\nchip.sio.pmbar=0x500\n"), kBoth},
      {word("sio-sch5327.toml", "=smsc_sch5327b\n", "=smsc_sch5327b\nchip.smsc_sch5327b.cfgbar=0x4E\n"), kBoth},
      {word("sio-sch5327.toml", "\"30\" = 0x01", "\"30\" = 0x00"), kBoth},  // the run-time registers do not answer
      {single("ich-desktop.toml", "mbdetect.ini", "chips=ich\n", "chips=ich\nchip.ich.gpiobar=0xF000\n"), kGreen},
      // The line serves another function, or is an input.
      {single("ich-desktop.toml", "machine.toml", "\"01\" = 0x31", "\"01\" = 0x21"), kGreen},
      {single("ich-desktop.toml", "machine.toml", "\"05\" = 0x2F", "\"05\" = 0x3F"), kGreen},
      {single("ich-desktop.toml", "mbtest.ini", "primary=12", "primary=96"), kGreen, "cannot be lit"},
      {single("smbus-desktop.toml", "mbdetect.ini", "saddr=0x58", "saddr=0x2C"), kGreen, "cannot be lit"},
      {single("smbus-desktop.toml", "mbtest.ini", "03:0xC4", "07:0xC4"), kGreen, "cannot be lit"},
      {single("smbus-desktop.toml", "machine.toml", "= 0x5000", "= 0x5000\nfault = \"stuck-busy\""), kGreen,
       "cannot be lit"},
      {single("saddle-desktop.toml", "machine.toml", "base = 0x4E", "base = 0x2E"), kGreen},
      // This class leaves the lighting to a chip, and has none.
      {single("sio-win.toml", "mbdetect.ini", "platform=generic\nchips=win\n", "MotherboardClass=Lantern\n"), kGreen,
       "the board class Lantern has no chip \"win\""},
      // Keys, lines, orders and waits of the generic classes.
      {edited("sio-ite.toml", "TwoColorPower", "chip.ini", "0x87,0x01,0x55,0x55", "0x87,0x01,0x55,0xAA"), kBoth},
      {edited("sio-ite.toml", "TwoColorPower", "chip.ini", "powerled.ldn=0x07", "powerled.ldn=0x04"), kBoth},
      {edited("sio-ite.toml", "TwoColorPower", "chip.ini", "secondary.gpio=23", "secondary.gpio=24"), {"power-red"}},
      {edited("sio-ite.toml", "TwoColorPower", "chip.ini", "regs=0x26,0xC1,", "regs=0x26,"),
       {},
       "",
       "super-io device 07"},
      {edited("sio-fintek.toml", "TwoColorPower", "chip.ini", "exit.sequence=0xAA", "exit.sequence=undef"),
       {},
       "",
       "mode = open"},
      {edited("sio-fintek.toml", "TwoColorPower", "chip.ini", "powerled.ldn=0x0A", "powerled.ldn=0x06"), kBoth},
      {edited("ec-notebook.toml", "EcNotebook", "chip.ini", "0xA2:0x01,0xEE:0x00", "0xEE:0x00,0xA2:0x01"),
       {"power-amber"}},
      {edited("ec-notebook.toml", "EcNotebook", "chip.ini", "0xA2:0x00,0xEE:0x01", "undef"),
       {},
       "",
       "after ec lamps = (held)"},
      {edited("ec16-notebook.toml", "EcNotebook", "chip.ini", "sc.port=0x6C", "sc.port=0x66"),
       {"power-white", "power-amber"}},
      {edited("mailbox-notebook.toml", "MailboxNotebook", "mbtest.ini", "waittime=50", "waittime=20"),
       {"power-white", "charge-white", "charge-amber"},
       "",
       "mode = open"},
      {edited("codec-notebook.toml", "CodecNotebook", "chip.ini", "set.sequence=0x00171600,", "set.sequence="),
       {"speaker-mute", "microphone-mute"}},
      {edited("codec-notebook.toml", "CodecNotebook", "mbdetect.ini", "=0x001B0010", "=0x001B0014"),
       {"speaker-mute", "microphone-mute"}},
  };
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run = LedRun(Prepare(installation, c.board), c.board.section, {"-Retries=0"}, "perfect", 2);
    SCOPED_TRACE(c.board.edits.front().wrong + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, c.still.empty() ? 0 : 1);
    for (const std::string& lamp : c.still) {
      EXPECT_LE(outcome.TimesLit(lamp), 1U) << lamp;  // when the other lamp's turn is over
    }
    if (c.board.section == "Default") {
      EXPECT_THAT(outcome.Tagged("ReportFailure"), ::testing::ElementsAre("ReportFailure 770133"));
      EXPECT_EQ(outcome.TimesLit("power-green"), 0U);
    }
    EXPECT_THAT(outcome.errors, HasSubstr(c.told));
    if (c.leftBehind == nullptr) {
      EXPECT_THAT(outcome.leftBehind, IsEmpty());
    } else {
      EXPECT_THAT(outcome.leftBehind, ::testing::Contains(HasSubstr(c.leftBehind)));
    }
  }
}

}  // namespace
}  // namespace panelglow::systemtest
