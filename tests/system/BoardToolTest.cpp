// The integrator's program as a person at a bench uses it.
#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

constexpr const char* kReal = "panelglow-board";
constexpr const char* kSimulated = "panelglow-board-sim";

Outcome Ask(const Installation& installation, const char* program, const std::vector<std::string>& arguments,
            const std::map<std::string, std::string>& environment = {}) {
  return RunProgram(program, arguments, installation.Path(""), environment);
}

// With what a person types.
Outcome Type(const Installation& installation, const std::string& typed, const std::string& call,
             const std::map<std::string, std::string>& environment = {}) {
  installation.Write("typed", typed);
  installation.Write("call.sh", "exec " PANELGLOW_BINARY_DIR "/" + call + " < typed\n");
  return RunProgram("/bin/sh", {"call.sh"}, installation.Path(""), environment);
}

TEST(SystemBoardTool, HelpsAnybodyAndTellsWrongCallsFromWhatCannotBe) {
  const Installation installation;
  for (const char* const verb : {"explain", "check", "report", "fans", "zones", "detect", "blink", "try", "replay"}) {
    const Outcome help = Ask(installation, kReal, {verb, "--help"});
    EXPECT_EQ(help.exitCode, 0) << verb;
    EXPECT_THAT(help.output, HasSubstr("--help")) << verb;
  }
  struct Call {
    std::vector<std::string> arguments;
    int exitCode;
    const char* says;
  };
  for (const Call& call :
       {Call{{}, 2, "name a verb: explain, check, report,"},
        Call{{"explian"}, 2, "name a verb: explain"},
        Call{{"replay", "ui.xml"}, 2, "name the verb that the trace is played to"},
        Call{{"explain"}, 2, "--board"},
        Call{{"explain", "--board", "7D10", "lamp"}, 2, "there is no LED \"lamp\": name one of power-"},
        Call{{"explain", "--board", "7D10", "--folder", "none"}, 3, "can be read: start in the folder"},
        Call{{"explain", "--board", "0000"}, 1, ""},
        Call{{"check", "--format", "xml"}, 2, ""},
        Call{{"blink", "power-green"}, 2, "give --seconds"},
        Call{{"blink", "power-green", "--seconds", "1"}, 3, "no driver on this machine"},
        Call{{"fans"}, 3, "no driver on this machine"},
        Call{{"try", "--chip", "fin"}, 2, "the walk knows g_iospace"},
        Call{{"try", "--chip", "g_iospace", "--at", "A20"}, 2, "name the register with --at"},
        Call{{"try", "--chip", "g_memoryspace", "--at", "0x1FFFFFFFF"}, 2, "an address is 0 to"},
        Call{{"try", "--chip", "g_memoryspace", "--at=-1"}, 2, "an address is 0 to"},
        Call{{"try", "--chip", "g_iospace", "--at", "0xA20", "--lines", "0-7"}, 2, "g_iospace has bits and no lines"},
        Call{{"try", "--chip", "g_ite"}, 2, "name them with --lines, as 20-27"},
        Call{{"try", "--chip", "g_ite", "--lines", "20-27", "--board", "A]B["}, 2, "\"A]B[\" is no system id"},
        Call{{"--trace", "t", "replay", "ui.xml", "fans"}, 2, "leave --trace out"},
        Call{{"fans", "--rounds", "2"}, 2, "--watch"},
        Call{{"report"}, 1, ""},
        Call{{"replay", "ui.xml", "fans"}, 3, "is no trace of panelglow-board"}}) {
    const Outcome outcome = Ask(installation, kReal, call.arguments);
    EXPECT_EQ(outcome.exitCode, call.exitCode) << ::testing::PrintToString(call.arguments) << outcome.errors;
    EXPECT_THAT(outcome.errors, HasSubstr(call.says));
  }
  EXPECT_THAT(Ask(installation, kReal, {"report"}).output, HasSubstr("This report is incomplete:\n"));
  installation.Write("full.sh", "exec " PANELGLOW_BINARY_DIR "/panelglow-board explain --board 7D10 > /dev/full\n");
  const Outcome full = RunProgram("/bin/sh", {"full.sh"}, installation.Path(""), {});
  EXPECT_EQ(full.exitCode, 3);
  EXPECT_THAT(full.errors, HasSubstr("standard output did not take everything: "));
  EXPECT_THAT(Ask(installation, kSimulated, {"replay", "--help"}).output,
              HasSubstr("Usage: panelglow-board-sim replay [OPTIONS] file VERB"));
  for (const std::vector<std::string>& call :
       {std::vector<std::string>{"--machine", "x", "replay", "t", "fans"}, {"--real-time", "replay", "t", "fans"}}) {
    const Outcome refused = Ask(installation, kSimulated, call);
    EXPECT_EQ(refused.exitCode, 2);
    EXPECT_THAT(refused.errors, StartsWith("panelglow-board-sim: the trace answers in place of a machine"));
  }
  const Outcome folder = Ask(installation, kSimulated, {"--machine", ".", "fans"});
  EXPECT_EQ(folder.exitCode, 3);
  EXPECT_THAT(folder.errors, HasSubstr("the machine's file . cannot be read"));
  // A folder stands for what nobody may read, since a test may run as root.
  std::filesystem::remove(installation.Path("mbtest.ini"));
  std::filesystem::create_directory(installation.Path("mbtest.ini"));
  for (const std::vector<std::string>& call : {std::vector<std::string>{"explain", "--board", "7D10"}, {"report"}}) {
    const Outcome unread = Ask(installation, kReal, call);
    EXPECT_EQ(unread.exitCode, 3) << call.front();
    EXPECT_THAT(unread.errors, HasSubstr("mbtest.ini is there and cannot be read"));
  }
}

TEST(SystemBoardTool, CheckSpeaksToProgramsAndStandsWhatIsHostile) {
  const Installation installation;
  EXPECT_EQ(Ask(installation, kReal, {"check"}).exitCode, 0);
  installation.Replace("mbtest.ini", "test.hdled.chip", "test.hdld.chip");
  const std::string line =
      "mbtest.ini:22:1: warning: nothing reads a key \"test.hdld.chip\"; is \"test.hdled.chip\" meant?";
  EXPECT_THAT(Ask(installation, kReal, {"check"}).output, StartsWith(line + " [unknown-key]\n"));
  EXPECT_THAT(Ask(installation, kReal, {"check", "--format", "json"}).output,
              AllOf(StartsWith("["), HasSubstr("\"line\": 22"), HasSubstr("\"rule\": \"unknown-key\"")));
  EXPECT_THAT(Ask(installation, kReal, {"check", "--format", "sarif"}).output,
              AllOf(HasSubstr("\"version\": \"2.1.0\""), HasSubstr("\"startLine\": 22")));

  installation.Replace("chip.ini", "powerled.color.primary.gpio=22", "powerled.color.primary.gpio=18");
  EXPECT_THAT(
      Ask(installation, kReal, {"check"}).output,
      HasSubstr(":29: error: invalid primary led map. Check powerled.color.primary.gpio entry. [board-fails]\n"));

  std::string deep = "<UI>";
  for (int i = 0; i < 100000; ++i) {
    deep += "<a>";
  }
  std::string wide;
  for (int i = 0; i < 2000; ++i) {
    wide += "[" + std::to_string(i) + "]\nplatform=generic\nchips=g_iospace\n";
  }
  std::string bytes;
  for (int i = 0; i < 100000; ++i) {
    bytes += static_cast<char>(1 + i * 37 % 255);
  }
  const std::pair<const char*, std::string> hostile[] = {{"ui.xml", deep},
                                                         {"mbdetect.ini", wide},
                                                         {"chip.ini", bytes},
                                                         {"buttondefinition.xml", bytes},
                                                         {"msctrl.ini", bytes},
                                                         {"chip.ini", std::string(std::size_t{16} << 20U, '[')},
                                                         {"chip.ini", "[a]\nbase=b\n[b]\nbase=a\n"}};
  for (const auto& [name, text] : hostile) {
    const Installation broken;
    broken.Write(name, text);
    const Outcome outcome = Ask(broken, kReal, {"check"});
    EXPECT_EQ(outcome.exitCode, 1) << name;
    EXPECT_THAT(outcome.output, HasSubstr(name));
  }
}

// From an empty section to a test that is passed: what the walk prints is all that the files need.
TEST(SystemBoardTool, TheWalkFindsTheLampsOfABoardThatNothingKnows) {
  const Installation installation;
  const std::string machine = installation.Machine("desktop.toml");
  for (const char* const file : {"mbdetect.ini", "mbtest.ini"}) {
    installation.Replace(file, "[7D10]", "[gone]");
  }
  EXPECT_EQ(Ask(installation, kSimulated, {"--machine", machine, "blink", "power-green", "--seconds", "1"}).exitCode,
            3);
  const Outcome walk = Type(installation, "power-green\nlamp\npower-red\n\n\n\n\n\n\n",
                            "panelglow-board-sim --machine " + machine + " try --chip g_iospace --at 0xA20",
                            {{"PANELGLOW_SIM_REPORT", installation.Path("report").string()}});
  ASSERT_EQ(walk.exitCode, 0) << walk.errors;
  EXPECT_THAT(walk.errors, HasSubstr("bit 1 of port 0x0A20: on the panel moves power-red; which lamp moved?"));
  EXPECT_THAT(walk.errors, HasSubstr("\"lamp\" is no answer"));
  EXPECT_THAT(installation.Read("report"), Not(HasSubstr("\nafter ")));
  const std::size_t test = walk.output.find("; mbtest.ini\n");
  ASSERT_NE(test, std::string::npos);
  installation.Write("mbdetect.ini", installation.Read("mbdetect.ini") + walk.output.substr(0, test));
  installation.Write("mbtest.ini", installation.Read("mbtest.ini") + walk.output.substr(test));
  installation.Replace("mbdetect.ini", "[gone]", "[7D99]");
  installation.Replace("mbtest.ini", "[gone]", "[7D99]");
  EXPECT_EQ(Ask(installation, kReal, {"check"}).output, "");
  const Outcome run = LedRun(machine, "TwoColorPower").In(installation);
  EXPECT_EQ(run.exitCode, 0) << run.output;
  EXPECT_GE(run.TimesLit("power-green"), 2U);
  EXPECT_GE(run.TimesLit("power-red"), 2U);
}

// What two walks find on one machine stands in one section.
TEST(SystemBoardTool, ASecondWalkKeepsWhatTheFirstHasFound) {
  const Installation installation;
  const std::string call = "panelglow-board-sim --machine " + installation.Machine("desktop.toml") +
                           " try --chip g_iospace --at 0xA20 --bits ";
  for (const char* const file : {"mbdetect.ini", "mbtest.ini"}) {
    installation.Replace(file, "[7D10]", "[7D99]");
  }
  const std::string first = Type(installation, "power-white\n", call + "0-0").output;
  installation.Write("mbdetect.ini", installation.Read("mbdetect.ini") + first.substr(0, first.find("; mbtest.ini")));
  const std::string second = Type(installation, "power-amber\n", call + "1-1").output;
  EXPECT_THAT(second, StartsWith("; mbdetect.ini, in place of its section [7D10]\n"));
  EXPECT_THAT(second,
              AllOf(HasSubstr("green.assert.sequence=0xA20:0x01\n"), HasSubstr("red.assert.sequence=0xA20:0x02\n")));
  EXPECT_THAT(second, Not(HasSubstr("undef")));
}

TEST(SystemBoardTool, TheWalkFindsLinesAndEndsWhenToldTo) {
  const Installation installation;
  const std::string machine = installation.Machine("sio-ite.toml");
  const Outcome walk = Type(installation, "\n\npower-green\n",
                            "panelglow-board-sim --machine " + machine + " try --chip g_ite --lines 20-27",
                            {{"PANELGLOW_SIM_REPORT", installation.Path("report").string()}});
  EXPECT_EQ(walk.exitCode, 0) << walk.errors;
  EXPECT_THAT(walk.output, HasSubstr("chips=g_ite\nchip.g_ite.powerled.color.primary.gpio=22\n"));
  EXPECT_THAT(
      walk.errors,
      HasSubstr("line 21: nothing moves on the panel; which lamp moved? line 22: on the panel moves power-green;"));
  EXPECT_THAT(
      Type(installation, "\n\n", "panelglow-board-sim --machine " + machine + " try --chip g_ite --lines 17-20")
          .errors,
      HasSubstr("line 18: the chip has no such line\nline 19: the chip has no such line\nline 20: "));
  EXPECT_THAT(installation.Read("report"), Not(HasSubstr("\nafter ")));
  EXPECT_EQ(Type(installation, "q\n", "panelglow-board-sim --machine " + machine + " try --chip g_ite --lines 20-27")
                .exitCode,
            1);
}

// Whatever ends the blinking, the machine is as it was.
TEST(SystemBoardTool, BlinkPutsBackHoweverItEnds) {
  const Installation installation;
  const std::map<std::string, std::string> report{{"PANELGLOW_SIM_REPORT", installation.Path("report").string()}};
  for (const char* const name : {"sio-fintek", "sio-ite", "ec-notebook", "notebook"}) {
    const std::string machine = installation.Machine(std::string(name) + ".toml");
    const Outcome blink =
        Ask(installation, kSimulated, {"--machine", machine, "blink", "power-green", "--seconds", "3"}, report);
    EXPECT_EQ(blink.exitCode, 0) << name << blink.errors;
    EXPECT_THAT(blink.errors, HasSubstr("(simulated); it writes "));
    EXPECT_THAT(installation.Read("report"), Not(HasSubstr("\nafter "))) << name;
    EXPECT_THAT(installation.Read("report"), HasSubstr("\nedge ")) << name;
  }
  const std::string machine = installation.Machine("sio-fintek.toml");
  const Outcome dark =
      Ask(installation, kSimulated,
          {"--machine", installation.Machine("desktop.toml"), "blink", "charge-amber", "--seconds", "1"});
  EXPECT_EQ(dark.exitCode, 1);
  EXPECT_THAT(dark.errors, AllOf(StartsWith("panelglow-board-sim: looks whether the charge LED, red or amber"),
                                 Not(HasSubstr("blinks the"))));
  installation.Write("call.sh", PANELGLOW_BINARY_DIR "/panelglow-board-sim --real-time --machine " + machine +
                                    " blink power-red --seconds 60 &\nsleep 1.5\nkill -$1 $!\nwait $!\n");
  for (const char* const signal : {"INT", "TERM", "HUP"}) {
    const Outcome ended = RunProgram("/bin/sh", {"call.sh", signal}, installation.Path(""), report);
    EXPECT_EQ(ended.exitCode, 0) << signal << ended.errors;
    EXPECT_THAT(installation.Read("report"), HasSubstr("\nend ")) << signal;
    EXPECT_THAT(installation.Read("report"), Not(HasSubstr("\nafter "))) << signal;
  }
}

TEST(SystemBoardTool, ATraceAnswersInPlaceOfTheMachine) {
  const Installation installation;
  const std::string machine = installation.Machine("desktop.toml");
  const std::vector<std::string> verb{"blink", "power-red", "--seconds", "2"};
  const auto with = [&](std::vector<std::string> first) {
    first.insert(first.end(), verb.begin(), verb.end());
    return first;
  };
  const Outcome recorded = Ask(installation, kSimulated, with({"--machine", machine, "--trace", "trace"}));
  EXPECT_EQ(recorded.exitCode, 0) << recorded.errors;
  const std::string trace = installation.Read("trace");
  EXPECT_THAT(trace, StartsWith("panelglow-board trace 1\nmachine simulated\nboard 7D10\n"));
  const Outcome played = Ask(installation, kSimulated, with({"replay", "trace"}));
  EXPECT_EQ(played.exitCode, 0) << played.errors;
  EXPECT_EQ(played.errors, recorded.errors);
  EXPECT_THAT(Ask(installation, kReal, with({"replay", "trace"})).errors,
              HasSubstr("recorded on a simulated machine"));

  struct Damage {
    const char* from;
    const char* to;
    const char* says;
  };
  for (const Damage& damage :
       {Damage{"control 220010 200a", "control 220010 210a", "damaged:6: the trace has"},
        Damage{"board 7D10\n", "board 7D10\nopen x 0\n", "damaged:4: the trace has \"open x 0\""},
        Damage{" 0 00 ;", " 0 zz ;", "a number is missing or damaged"},
        Damage{" 0 00 ;", " 0 0000 ;", "an answer of 1 bytes"},
        Damage{"sleep 32", "sleep 33", "where the program asks \"sleep 32\""}}) {
    std::string damaged = trace;
    damaged.replace(damaged.find(damage.from), std::string(damage.from).size(), damage.to);
    installation.Write("damaged", damaged);
    const Outcome outcome = Ask(installation, kSimulated, with({"replay", "damaged"}));
    EXPECT_EQ(outcome.exitCode, 3) << damage.to;
    EXPECT_THAT(outcome.errors, HasSubstr(damage.says));
  }
  installation.Write("damaged", trace + "tick 1\n");
  EXPECT_THAT(Ask(installation, kSimulated, with({"replay", "damaged"})).errors, HasSubstr("with 1 more requests"));
  EXPECT_EQ(Ask(installation, kSimulated, with({"--machine", machine, "--trace", "none/trace"})).exitCode, 3);
}

// What a bench with fans, sensors, switches and buttons tells, once and while it is watched.
TEST(SystemBoardTool, FansZonesAndDevicesAreReadWithTheirStates) {
  const Installation installation;
  const std::string machine = installation.Machine("bench-desktop.toml");
  const Outcome fans = Ask(installation, kSimulated, {"--machine", machine, "fans", "--log", "fans.log"});
  EXPECT_EQ(fans.exitCode, 0) << fans.errors;
  EXPECT_THAT(fans.output, AllOf(StartsWith("fan  name"), HasSubstr("Rear fan       fin   -"), HasSubstr("  ok\n")));
  EXPECT_THAT(installation.Read("fans.log"), HasSubstr("NumberOfFans=3\n"));
  EXPECT_THAT(installation.Read("fans.log.xml"), HasSubstr("<fantestresults>"));
  const Outcome zones = Ask(installation, kSimulated,
                            {"--machine", machine, "zones", "--json", "--watch", "--rounds", "2", "--log", "z.log"});
  EXPECT_EQ(zones.exitCode, 0) << zones.errors;
  EXPECT_THAT(zones.output, AllOf(StartsWith("[{\"zone\":1,"), HasSubstr("}]\n[{\"zone\":1,"), EndsWith("}]\n")));
  EXPECT_EQ(std::count(zones.output.begin(), zones.output.end(), '\n'), 2);
  EXPECT_THAT(installation.Read("z.log"), HasSubstr("Status=NoErr\n"));
  EXPECT_THAT(installation.Read("z.log.xml"), HasSubstr("<tempcautiontestresults>"));
  const Outcome devices = Ask(installation, kSimulated, {"--machine", machine, "detect"});
  EXPECT_EQ(devices.exitCode, 0) << devices.errors;
  EXPECT_THAT(devices.output, AllOf(HasSubstr("Jumpers"), HasSubstr("Hood"), HasSubstr("Buttons")));
  const Outcome report = Ask(installation, kSimulated, {"--machine", machine, "report", "--json"});
  EXPECT_THAT(report.output, AllOf(HasSubstr("\"Chassis fan\""), HasSubstr("\"register 0x"), HasSubstr("\"class\"")));
  const Outcome refused =
      Ask(installation, kSimulated, {"--machine", machine, "fans", "--log", "no/such/folder/fans.log"});
  EXPECT_EQ(refused.exitCode, 3);
  EXPECT_THAT(refused.errors, EndsWith("the log no/such/folder/fans.log cannot be written\n"));
}

}  // namespace
}  // namespace panelglow::systemtest
