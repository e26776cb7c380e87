// What a controller sees of whole runs: exit codes, result lines, the structured log, the panel.
#include <gmock/gmock.h>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

using Lines = std::vector<std::string>;

std::vector<std::string> NotebookTest(const std::vector<std::string>& more = {}) {
  std::vector<std::string> arguments = {"-subtest=CustomLEDTest", "-SectionID=Notebook"};
  arguments.insert(arguments.end(), more.begin(), more.end());
  return arguments;
}

std::string PercentagesOf(const Outcome& outcome) {
  std::string text;
  for (const std::string& line : outcome.Tagged("UpdatePercentage")) {
    text += line.substr(line.find(' '));
  }
  return text;
}

TEST(SystemVerdict, APerfectOperatorPassesOnEveryMachine) {
  const Installation installation;
  struct Case {
    const char* machine;
    const char* section;
  };
  for (const Case& c :
       {Case{"desktop.toml", "Desktop"}, Case{"desktop.toml", "Default"}, Case{"notebook.toml", "Notebook"},
        Case{"unknown-board.toml", "Desktop"}, Case{"unknown-board.toml", "Default"}}) {
    for (const unsigned seed : Seeds(2)) {
      const SimulatedRun run{installation.Machine(c.machine),
                             "perfect",
                             seed,
                             {},
                             {"-subtest=CustomLEDTest", std::string("-SectionID=") + c.section}};
      SCOPED_TRACE(run.Describe());
      const Outcome outcome = run.In(installation);
      EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
      EXPECT_TRUE(outcome.IsOrderly());
      EXPECT_THAT(outcome.Tagged("ReportFailure"), IsEmpty());
      EXPECT_EQ(PercentagesOf(outcome), " 0 1 5 10 20 30 40 50 80 100");
      if (std::string(c.machine) != "unknown-board.toml") {  // whose data register stays as the test left it
        EXPECT_THAT(outcome.leftBehind, IsEmpty());
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
      {"wrong:3", "-Retries=0", 1, "ReportFailure 770", "10 20 30 40 50 80", "0"},
      {"cancel:2", "-Retries=0", 1, "ReportFailure 990354", "10 20 30 40 50 80", "0"},
      {"silent", "-Retries=0", 1, "ReportFailure 770118", "10 20 30 40 50 80", "0"},
      {"silent", "-Retries=1", 1, "ReportFailure 770118", "10 20 30 40 50 80 10 20 30 40 50 80", "0"},
      {"slow:8", "-Retries=0", 0, "", "10 20 30 40 50 80", "1"},
      {"slow:70", "-Retries=0", 1, "ReportFailure 770118", "10 20 30 40 50 80", "0"},
  };
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run{installation.Machine("notebook.toml"),
                           c.person,
                           1,
                           {},
                           NotebookTest({c.retries, "-DataCollectionFile=log.xml", "-AutoStart=true"})};
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

TEST(SystemVerdict, TheStructuredLogRecordsEveryAttempt) {
  const Installation installation;
  const SimulatedRun run{installation.Machine("notebook.toml"),
                         "silent",
                         3,
                         {},
                         NotebookTest({"-Retries=2", "-DataCollectionFile=log.xml"})};
  const Outcome outcome = run.In(installation);
  const std::string log = installation.Read("log.xml");
  EXPECT_THAT(log, HasSubstr("<DiagnosticsData Version=\"4.15.0\">\n  <Diagnostic name=\"panelglow-diags\">\n"));
  EXPECT_THAT(log, HasSubstr("<Attempts retriesspecified=\"2\" retriesattempted=\"2\">"));
  for (const char* number : {"0", "1", "2"}) {
    EXPECT_THAT(log, HasSubstr("<Attempt number=\"" + std::string(number) + "\" errorcode=\"770"));
  }
  EXPECT_THAT(log, HasSubstr("<Argument name=\"-datacollectionfile\" value=\"log.xml\"/>"));
  EXPECT_THAT(log, Not(HasSubstr("<Results")));
  EXPECT_EQ(outcome.exitCode, 1);
}

TEST(SystemVerdict, TheSameSeedIsTheSameRunAndAnotherSeedIsNot) {
  const Installation installation;
  SimulatedRun run{installation.Machine("notebook.toml"), "perfect", 7, {}, NotebookTest()};
  const Outcome first = run.In(installation);
  const Outcome second = run.In(installation);
  EXPECT_EQ(first.output, second.output);
  EXPECT_FALSE(first.output.empty());
  run.seed = 8;
  EXPECT_NE(run.In(installation).output, first.output);
}

TEST(SystemVerdict, AKeyboardLedBlinksTwoAndAHalfTimesASecondAndABoardLedOnceASecond) {
  const Installation installation;
  const SimulatedRun run{installation.Machine("notebook.toml"), "slow:10", 2, {}, NotebookTest()};
  const Outcome outcome = run.In(installation);
  const auto periodOf = [&](const std::string& led) {
    std::vector<std::uint64_t> lit;
    for (const Edge& edge : outcome.edges) {
      if (edge.led == led && edge.lit && edge.time_us > 0) {
        lit.push_back(edge.time_us);
      }
    }
    return lit.size() < 6 ? 0 : (lit[5] - lit[1]) / 4 / 1000;  // ms
  };
  EXPECT_NEAR(static_cast<double>(periodOf("num-lock")), 400, 5);
  EXPECT_NEAR(static_cast<double>(periodOf("caps-lock")), 400, 5);
  EXPECT_NEAR(static_cast<double>(periodOf("charge-white")), 1000, 5);
  EXPECT_NEAR(static_cast<double>(periodOf("power-amber")), 1000, 5);
}

TEST(SystemVerdict, LedsAreTestedOneAfterTheOtherAndNeverTogether) {
  const Installation installation;
  for (const unsigned seed : Seeds(3)) {
    const SimulatedRun run{
        installation.Machine("notebook.toml"), "perfect", seed, {}, NotebookTest({"-OperatorCheating=false"})};
    SCOPED_TRACE(run.Describe());
    std::vector<std::string> order;
    for (const Edge& edge : run.In(installation).edges) {
      // White power is lit again behind each power LED's turn; the rest changes in its own turn only.
      if (edge.time_us > 0 && edge.led != "power-white" && (order.empty() || order.back() != edge.led)) {
        order.push_back(edge.led);
      }
    }
    EXPECT_EQ(order.size(), 7U) << ::testing::PrintToString(order);
  }
}

TEST(SystemVerdict, TheStatusIndicatorBlinksUntilItsTimeIsUpAndPutsTheLedBack) {
  struct Case {
    Lines arguments;
    const char* led;
    std::size_t blinks;
  };
  const Case kCases[] = {{{"-BlinkTime=1"}, "power-green", 57},
                         {{"-BlinkTime=1", "-BlinkType=RedPower|HardDrive"}, "power-red", 57},
                         {{"-BlinkTime=1", "-BlinkSpeed=5000"}, "power-green", 6}};
  for (const Case& c : kCases) {
    const Installation installation;
    Lines arguments = {"-subtest=LEDStatusIndicator"};
    arguments.insert(arguments.end(), c.arguments.begin(), c.arguments.end());
    const SimulatedRun run{installation.Machine("desktop.toml"), "", 1, {}, arguments};
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, 0);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_NEAR(static_cast<double>(outcome.TimesLit(c.led)), static_cast<double>(c.blinks), 2);
    EXPECT_EQ(PercentagesOf(outcome), " 1 100");
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

}  // namespace
}  // namespace panelglow::systemtest
