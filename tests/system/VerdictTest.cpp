// What a controller sees of whole runs: exit codes, result lines, the structured log, the panel, and what a run
// leaves behind; also on the machines whose lamps hang on Super-I/Os, embedded controllers and codecs.
#include <gmock/gmock.h>

#include <algorithm>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

using Lines = std::vector<std::string>;

std::string Event(const std::string& action) { return "\n[[event]]\nat_ms = 5000\n" + action + "\n"; }

std::string PercentagesOf(const Outcome& outcome) {
  std::string text;
  for (const std::string& line : outcome.Tagged("UpdatePercentage")) {
    text += line.substr(line.find(' '));
  }
  return text;
}

struct Lamp {
  const char* name;
  std::uint64_t lit_ms;  // of a blink
  std::uint64_t dark_ms;
  std::uint64_t tolerance_ms;
};

struct Machine {
  const char* file;
  const char* section;
  std::vector<Lamp> lamps;
  const char* mayLeave = nullptr;   // part of what it may leave in its registers
  const char* unknownId = nullptr;  // the system id of a board that no file knows
};

// A chip that blinks by itself keeps exact time. One that the program toggles has phases of 500 ms and what its
// writes take: a level port 30 ms each, the mailbox 50 ms each, the codec 10 ms and more for each of three verbs, and
// an embedded controller asked by the generic class the 8 ms for which its idle output buffer is watched in vain.
const std::vector<Machine>& Machines() {
  static const std::vector<Machine> kMachines = {
      {"desktop.toml", "Desktop", {}},
      {"desktop.toml", "Default", {}},
      {"notebook.toml", "Notebook", {{"num-lock", 200, 200, 5}, {"charge-white", 500, 500, 5}}},
      {"unknown-board.toml", "Desktop", {}, "", "7E40"},  // whose data register stays as the test left it
      {"unknown-board.toml", "Default", {}, "", "7E40"},
      {"sio-ite.toml", "TwoColorPower", {{"power-green", 500, 500, 0}, {"power-red", 500, 500, 0}}},
      {"sio-fintek.toml", "TwoColorPower", {{"power-green", 500, 500, 0}, {"power-red", 500, 500, 0}}},
      {"sio-generic.toml", "TwoColorPower", {{"power-green", 530, 560, 2}, {"power-red", 530, 560, 2}}},
      {"ec-notebook.toml", "EcNotebook", {{"power-white", 508, 508, 2}, {"power-amber", 508, 508, 2}}},
      {"ec16-notebook.toml", "EcNotebook", {{"power-white", 510, 510, 2}, {"power-amber", 510, 510, 2}}},
      {"old-ec.toml", "TwoColorPower", {{"power-green", 500, 500, 2}, {"power-red", 500, 500, 2}}},
      {"mailbox-notebook.toml",
       "MailboxNotebook",
       {{"power-white", 550, 550, 2}, {"charge-white", 800, 800, 2}, {"charge-amber", 800, 800, 2}},
       "mailbox configuration mode"},  // its class opens its chip's configuration ports and does not close them
      {"codec-notebook.toml", "CodecNotebook", {{"speaker-mute", 570, 570, 2}, {"microphone-mute", 570, 570, 2}}},
      {"casl-notebook.toml",
       "FirmwareNotebook",
       {{"power-white", 500, 500, 2}, {"wireless", 1000, 1000, 10}},
       "radio 02"},  // was off: one call switches all radios, and they are put back as on when one was
      {"drives-desktop.toml", "DrivesDesktop", {{"sata-drive", 500, 500, 80}, {"nvme-drive", 500, 500, 80}}},
      {"office-notebook.toml", "OfficeNotebook", {{"drive", 500, 500, 80}, {"camera", 500, 500, 5}}, nullptr, "7E10"},
  };
  return kMachines;
}

// How many whole phases, lit and dark, have the length they should have.
std::size_t GoodPhases(const Outcome& outcome, const Lamp& lamp) {
  std::vector<Edge> edges;
  std::copy_if(outcome.edges.begin(), outcome.edges.end(), std::back_inserter(edges),
               [&](const Edge& edge) { return edge.led == lamp.name && edge.time_us > 0; });
  std::size_t good = 0;
  for (std::size_t i = 1; i < edges.size(); ++i) {
    const std::uint64_t phase_us = edges[i].time_us - edges[i - 1].time_us;
    const std::uint64_t wanted_us = (edges[i].lit ? lamp.dark_ms : lamp.lit_ms) * 1000;
    const std::uint64_t off_us = phase_us > wanted_us ? phase_us - wanted_us : wanted_us - phase_us;
    good += off_us <= lamp.tolerance_ms * 1000 ? 1 : 0;
  }
  return good;
}

// What people are told: nothing, but for a board that no file knows.
std::string ToldOf(const char* unknownId) {
  const std::string id = unknownId == nullptr ? "" : unknownId;
  return id.empty() ? ""
                    : "panelglow-diags: This machine's board is not known: its system id is \"" + id +
                          "\", and section [" + id +
                          "] is not in .\\mbdetect.ini and .\\mbtest.ini; without \"platform\" or \"chips\" there, a "
                          "test that knows the ports of the oldest desktops uses them for power and drive.\n";
}

TEST(SystemVerdict, APerfectOperatorPassesOnEveryMachineAndEveryLampBlinksInItsTimeAndIsLeftAsItWas) {
  for (const Machine& machine : Machines()) {
    for (const unsigned seed : Seeds(2)) {
      const bool patient = seed % 2 == 1;
      const Installation installation;
      const SimulatedRun run = LedRun(installation.Machine(machine.file), machine.section, {"-Retries=0"},
                                      patient ? "slow:5" : "perfect", seed);
      SCOPED_TRACE(run.Describe());
      const Outcome outcome = run.In(installation);
      EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
      EXPECT_TRUE(outcome.IsOrderly());
      EXPECT_THAT(outcome.Tagged("ReportFailure"), IsEmpty());
      EXPECT_EQ(PercentagesOf(outcome), " 0 1 5 10 20 30 40 50 80 100");
      for (const Lamp& lamp : machine.lamps) {
        EXPECT_GE(GoodPhases(outcome, lamp), patient ? 8U : 0U) << lamp.name;
      }
      EXPECT_THAT(outcome.LeftChanged(), IsEmpty());
      EXPECT_EQ(outcome.errors, ToldOf(machine.unknownId));
      for (const std::string& line : outcome.leftBehind) {
        EXPECT_TRUE(machine.mayLeave != nullptr && line.find(machine.mayLeave) != std::string::npos) << line;
      }
    }
  }
}

TEST(SystemVerdict, EachKindOfOperatorGetsHisVerdict) {
  struct Case {
    const char* person;
    const char* retries;
    int exitCode;
    const char* failure;   // the ReportFailure line; empty for none
    const char* attempts;  // percentages of the attempts
    const char* status;    // in the structured log
  };
  const Case kCases[] = {
      {"perfect", "-Retries=10", 0, "", "10 20 30 40 50 80", "1"},
      {"wrong:1", "-Retries=0", 1, "ReportFailure 770", "10 20 30 40 50 80", "0"},
      {"wrong:1", "-Retries=1", 0, "", "10 20 30 40 50 80 10 20 30 40 50 80", "1"},
      {"cancel:2", "-Retries=0", 1, "ReportFailure 990354", "10 20 30 40 50 80", "0"},
      {"silent", "-Retries=0", 1, "ReportFailure 770118", "10 20 30 40 50 80", "0"},
      {"silent", "-Retries=1", 1, "ReportFailure 770118", "10 20 30 40 50 80 10 20 30 40 50 80", "0"},
      {"slow:70", "-Retries=0", 1, "ReportFailure 770118", "10 20 30 40 50 80", "0"},
  };
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run = LedRun(installation.Machine("notebook.toml"), "Notebook",
                                    {c.retries, "-DataCollectionFile=log.xml", "-AutoStart=true"}, c.person);
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, c.exitCode);
    EXPECT_TRUE(outcome.IsOrderly());
    const Lines failures = outcome.Tagged("ReportFailure");
    EXPECT_EQ(failures.size(), *c.failure == '\0' ? 0U : 1U);
    for (const std::string& line : failures) {
      EXPECT_THAT(line, HasSubstr(c.failure));
      EXPECT_THAT(outcome.Tagged("TestFailed"), ElementsAre(HasSubstr("TestFailed 7710")));  // the button's own code
    }
    EXPECT_EQ(PercentagesOf(outcome), " 0 1 5 " + std::string(c.attempts) + (c.exitCode == 0 ? " 100" : ""));
    EXPECT_THAT(installation.Read("log.xml"), HasSubstr("status=\"" + std::string(c.status) + "\""));
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

TEST(SystemVerdict, TheStatusIndicatorBlinksUntilItsTimeIsUpOrItIsStoppedAndPutsTheLedBack) {
  struct Case {
    Lines arguments;
    std::string event;
    const char* led;
    std::size_t blinks;
  };
  const std::string subtest = "-subtest=LEDStatusIndicator";
  const Case kCases[] = {{{subtest, "-BlinkTime=1"}, "", "power-green", 57},
                         {{subtest, "-BlinkTime=1", "-BlinkType=RedPower|HardDrive"}, "", "power-red", 57},
                         {{subtest, "-BlinkTime=1", "-BlinkSpeed=5000"}, "", "power-green", 6},
                         {{subtest, "-BlinkTime=1", "-BlinkType=HardDrive"}, "", "power-green", 0},
                         {{subtest}, Event("console = 1"), "power-green", 5},
                         {{subtest}, Event("write_file = '\\kill.ctl'"), "power-green", 5}};
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run{installation.Machine("desktop.toml", c.event), "", 1, {}, c.arguments};
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_NEAR(static_cast<double>(outcome.TimesLit(c.led)), static_cast<double>(c.blinks), 2);
    constexpr std::uint64_t kPuttingBack_us = 1'000'000;
    const bool changes = std::any_of(outcome.edges.begin(), outcome.edges.end(), [&](const Edge& edge) {
      return edge.led == c.led && edge.time_us > 0 && edge.time_us + kPuttingBack_us < outcome.end_us;
    });
    EXPECT_EQ(changes, c.blinks != 0);  // a type without a power colour leaves the lamp as it is, and is told
    EXPECT_EQ(outcome.errors.find("names neither") != std::string::npos, c.blinks == 0) << outcome.errors;
    EXPECT_EQ(PercentagesOf(outcome), " 1 100");
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

TEST(SystemRunControl, AnUnknownBoardEndsTheSignalLampWithAMessage) {
  const Installation installation;
  const SimulatedRun run{installation.Machine("unknown-board.toml"), "", 1, {}, {"-subtest=LEDStatusIndicator"}};
  const Outcome outcome = run.In(installation);
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_TRUE(outcome.IsOrderly());
  EXPECT_THAT(outcome.output, HasSubstr("board is not known"));
}

// What comes from outside during a run: control files and console events.

TEST(SystemRunControl, WhateverStopsARunEndsItWithItsCodeAndStatus) {
  struct Case {
    const char* event;
    bool stops;
  };
  const Case kCases[] = {
      {"console = 0", true},
      {"console = 1", true},
      {"console = 2", false},
      {"write_file = '.\\kill.ctl'", true},
      {"write_file = '\\kill.ctl'", true},
      {"write_file = '\\halcyon.ctl'\ncontent = 'terminate'", true},
      {"write_file = '\\halcyon.ctl'\ncontent = 'Terminate'", false},
      {"write_file = 'C:\\ProgramData\\Tamberlane\\TMB Halcyon Hardware Diagnostics\\kill.ctl'", true},
      {"write_file = 'C:\\ProgramData\\Tamberlane\\TMB Halcyon Hardware Diagnostics\\halcyon.ctl'\n"
       "content = 'terminate'",
       true},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.event);
    const Installation installation;
    const Outcome outcome =
        LedRun(installation.Machine("desktop.toml", Event(c.event)), "Desktop", {"-DataCollectionFile=log.xml"})
            .In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, c.stops ? 1 : 0);
    EXPECT_THAT(installation.Read("log.xml"), HasSubstr(c.stops ? "status=\"-1\"" : "status=\"1\""));
    if (c.stops) {
      EXPECT_THAT(outcome.Tagged("TestFailed"), ElementsAre("TestFailed 995000 \"\""));
      EXPECT_THAT(installation.Read("log.xml"), HasSubstr("<Attempt number=\"0\" errorcode=\"995000\"/>"));
    }
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

}  // namespace
}  // namespace panelglow::systemtest
