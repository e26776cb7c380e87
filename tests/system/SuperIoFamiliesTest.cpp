// Whole runs on the machines whose Super-I/O has a class that knows its registers: each lamp blinks at its turn and
// is put back, however the run ends, and a wrong word or another strap leaves it dark.
#include <gmock/gmock.h>

#include "system/LampRuns.h"

namespace panelglow::systemtest {
namespace {

using ::testing::IsEmpty;

// ---- a class that has no machine of its own: a committed one with other registers

constexpr const char* kTwoBits = "high = [0x40]\nblinks = { \"80\" = 1000, \"C0\" = 500 }";  // bits 7 and 6

// The machine of another class.
Board Of(const std::string& machine, const std::string& chip, const std::string& other,
         const std::vector<std::pair<std::string, std::string>>& registers, bool hasSignal = true) {
  Board board{.machine = machine,
              .edits = {{"mbdetect.ini", "=" + chip + "\n", "=" + other + "\n"},
                        {"mbtest.ini", "=" + chip + "\n", "=" + other + "\n"}},
              .hasSignal = hasSignal};
  for (const auto& [right, wrong] : registers) {
    board.edits.push_back({"machine.toml", right, wrong});
  }
  return board;
}

// A lamp of two colours in place of the Winbond machine's one, each on a pin with a mode.
Board OfPins(const std::string& other, const std::string& registers, const std::string& green,
             const std::string& red) {
  Board board = Of("sio-win.toml", "win", other,
                   {{"\"30\" = 0x01\n\"F3\" = 0x40\n", registers},
                    {"device = 0x09\nregister = 0xF3\nmask = 0xC0\nhigh = [0x00]\n"
                     "blinks = { \"80\" = 500, \"C0\" = 2000 }\n",
                     green + "\n[[chip.led]]\nname = \"RED\"\n" + red},
                    {"active_low = true\n",
                     "\n[[led]]\nname = \"power-red\"\nsymbol = \"power\"\ncolor = \"red\"\ndevice = \"super-io\"\n"
                     "pin = \"RED\"\n"}});
  board.edits.push_back({"mbtest.ini", "redled.support=no", "redled.support=yes"});
  return board;
}

std::vector<Board> Derived() {
  // Fintek: a pin's two bits stand elsewhere; the LED of the first keeps its colour when it is told to go out, so
  // that its colours blink by themselves, and the second has blinking colours alone.
  std::vector<Board> boards = {
      Of("sio-fin.toml", "fin", "fin_f8000",
         {{"\"2A\" = 0x40  # green, steady\n\"2B\" = 0x20", "\"2A\" = 0x60\n\"2B\" = 0x60"},
          {"mask = 0x30\nhigh = [0x10]\nblinks = { \"20\" = 1000, \"30\" = 500 }",
           "mask = 0x03\nhigh = [0x02]\nblinks = { \"01\" = 500 }"},
          {std::string("mask = 0xC0\n") + kTwoBits, "mask = 0x30\nhigh = [0x20]\nblinks = { \"10\" = 500 }"}}),
      Of("sio-f71808.toml", "fin_f71808a", "fin_f71855",
         {{"= 0x0A", "= 0x01"},
          {"register = 0xF8", "register = 0xF9"},
          {"\"F9\" = 0x40", "\"F9\" = 0x10"},
          {"\"02\" = 1000, ", ""},
          {std::string("mask = 0xC0\n") + kTwoBits, "mask = 0x30\nhigh = [0x10]\nblinks = { \"30\" = 500 }"}},
         false),
      Of("sio-f71808.toml", "fin_f71808a", "fin_f71808e",
         {{"\"F8\" = 0x0C", "\"F8\" = 0x01"},
          {"\"F9\" = 0x40", "\"F9\" = 0x00"},
          {std::string("mask = 0xC0\n") + kTwoBits, "mask = 0x03\nhigh = [0x01]"},
          {"register = 0xF9", "register = 0xFF"},
          {"register = 0xF8", "register = 0xF9"},
          {"register = 0xFF", "register = 0xF8"}}),
      // ITE: both lines are inverted, so that the one without the blinker is dark.
      Of("sio-ite-old.toml", "ite", "ite_8758",
         {{"\"26\" = 0x04", "\"26\" = 0x0C"}, {"\"C9\" = 0x0C", "\"B1\" = 0x0C\n\"C9\" = 0x0C"}}),
      Of("sio-ite-old.toml", "ite", "ite_8772", {{"\"C9\" = 0x0C", "\"B1\" = 0x0C\n\"C9\" = 0x0C"}}),
      // Always open, with the LED on one port.
      Of("sio-wpcd376.toml", "win_wpcd376", "nuv_npcd378h",
         {{"0x07", "0x08"},
          {"\"25\" = 0x40", "\"25\" = 0x58"},
          {"= 0x40  # output levels", "= 0x1E"},
          {"mask = 0x40\nhigh = [0x40]\notherwise = true", "mask = 0x1F\nhigh = [0x1E]"},
          {"mask = 0x10\nhigh = [0x10]", "mask = 0x1F\nhigh = [0x1F]"}}),
      // Winbond and Nuvoton: one mode for both colours, and a line that chooses; or a bit for each.
      OfPins("nuv_w83667",
             "\"30\" = 0x0A\n\"E4\" = 0xFF\n\n[[chip.device]]\nnumber = 0x0D\n[chip.device.registers]\n"
             "\"EC\" = 0x31\n",
             "device = 0x0D\nregister = 0xEC\nmask = 0xF0\nblinks = { \"A0\" = 500 }\nneeds = [\n"
             "{ device = 0x09, register = 0xEA, mask = 0x80 },\n{ device = 0x09, register = 0xF5, mask = 0x01, value"
             " = 0x00 }]\n",
             "device = 0x0D\nregister = 0xEC\nmask = 0xF0\nblinks = { \"A0\" = 500 }\nneeds = [\n"
             "{ device = 0x09, register = 0xEA, mask = 0x80 },\n{ device = 0x09, register = 0xF5, mask = 0x01 }]\n"),
      OfPins("nuv_nct5572",
             "\"30\" = 0x01\n\n[[chip.device]]\nnumber = 0x07\n[chip.device.registers]\n\"E5\" = 0xB0\n",
             "device = 0x07\nregister = 0xE5\nmask = 0x80\nhigh = [0x80]\nneeds = [\n"
             "{ device = 0x07, register = 0xED, mask = 0xC0, value = 0x00 }]\n",
             "device = 0x07\nregister = 0xE5\nmask = 0x40\nhigh = [0x40]\nneeds = [\n"
             "{ device = 0x07, register = 0xED, mask = 0xC0, value = 0x00 }]\n"),
      OfPins("win_w83202g", "\"30\" = 0x01\n\"F0\" = 0xFF\n\"F3\" = 0x29\n",
             "device = 0x09\nregister = 0xF3\nmask = 0x20\nhigh = [0x20]\nneeds = [\n"
             "{ device = 0x09, register = 0xF0, mask = 0x10 }]\n",
             "device = 0x09\nregister = 0xF3\nmask = 0x20\nhigh = [0x20]\nneeds = [\n"
             "{ device = 0x09, register = 0x30, mask = 0x0A },\n{ device = 0x09, register = 0xF9, mask = 0x10 },\n"
             "{ device = 0x09, register = 0xF0, mask = 0x10, value = 0x00 }]\n"),
  };
  boards[7].edits.push_back({"machine.toml", "base = 0x4E", "base = 0x2E"});
  return boards;
}

// ---- all boards

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
  static const std::vector<Board> kAll = [] {
    std::vector<Board> all = kBoards;
    for (const Board& board : Derived()) {
      all.push_back(board);
    }
    return all;
  }();
  return kAll;
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
