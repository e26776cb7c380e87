// What comes from outside during a run: control files, console events, other processes' locks.
#include <gmock/gmock.h>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

std::string Event(const std::string& action) { return "\n[[event]]\nat_ms = 5000\n" + action + "\n"; }

const std::vector<std::string> kDesktopTest = {"-subtest=CustomLEDTest", "-SectionID=Desktop",
                                               "-DataCollectionFile=log.xml"};

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
      {"write_file = '\\halcyon.ctl'\ncontent = \"terminate\\n\"", false},
      {"write_file = '\\halcyon.ctl'\ncontent = 'Terminate'", false},
      {"write_file = '\\halcyon.ctl'\ncontent = 'pause'", false},
      {"write_file = 'C:\\ProgramData\\Tamberlane\\TMB Halcyon Hardware Diagnostics\\kill.ctl'", true},
      {"write_file = 'C:\\ProgramData\\Tamberlane\\TMB Halcyon Hardware Diagnostics\\halcyon.ctl'\n"
       "content = 'terminate'",
       true},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.event);
    const Installation installation;
    const SimulatedRun run{installation.Machine("desktop.toml", Event(c.event)), "perfect", 1, {}, kDesktopTest};
    const Outcome outcome = run.In(installation);
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

TEST(SystemRunControl, AnEndlessSignalLampStopsAtAControlFileAndPutsTheLedBack) {
  for (const char* event : {"console = 1", "write_file = '\\kill.ctl'"}) {
    SCOPED_TRACE(event);
    const Installation installation;
    const SimulatedRun run{
        installation.Machine("desktop.toml", Event(event)), "", 1, {}, {"-subtest=LEDStatusIndicator"}};
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_THAT(outcome.Tagged("UpdatePercentage"), ElementsAre("UpdatePercentage 1", "UpdatePercentage 100"));
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

TEST(SystemRunControl, AnotherProcessesLockIsWaitedForAndThenTaken) {
  for (const char* lock : {"_HalcyonPromptLock", "_HalcyonMotherBoardLib"}) {
    SCOPED_TRACE(lock);
    const Installation installation;
    const std::string peer = "\n[[peer]]\nmutex = '" + std::string(lock) + "'\nfrom_ms = 0\nuntil_ms = 40000\n";
    const SimulatedRun run{installation.Machine("desktop.toml", peer), "perfect", 1, {}, kDesktopTest};
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, 0);
    std::uint64_t first = 0;
    for (const Edge& edge : outcome.edges) {
      first = first == 0 ? edge.time_us : first;
    }
    EXPECT_GE(first, 40'000'000U);  // nothing is shown or blinked before
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

TEST(SystemRunControl, AWorkerThatWaitsForAnotherProcessesBoardIsKilledAtTheEndAndLeavesNothingHeld) {
  // The board is taken for good just when the workers want it; the operator cancels at his second answer.
  const Installation installation;
  const std::string peer = "\n[[peer]]\nmutex = '_HalcyonMotherBoardLib'\nfrom_ms = 700\nuntil_ms = 4000000\n";
  for (const unsigned seed : Seeds(4)) {
    const SimulatedRun run{installation.Machine("notebook.toml", peer),
                           "silent",
                           seed,
                           {},
                           {"-subtest=CustomLEDTest", "-SectionID=Notebook", "-Retries=0"}};
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.Tagged("ReportFailure"), std::vector<std::string>{"ReportFailure 770118"});
    for (const std::string& left : outcome.leftBehind) {
      EXPECT_EQ(left, "owned _HalcyonMotherBoardLib");  // by the other process
    }
  }
}

}  // namespace
}  // namespace panelglow::systemtest
