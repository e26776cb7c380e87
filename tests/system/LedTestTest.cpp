// Whole runs of the operator test whose LEDs are chosen by parameters.
#include <gmock/gmock.h>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

using Lines = std::vector<std::string>;

SimulatedRun RunOf(const Installation& installation, const Lines& arguments, const std::string& person) {
  SimulatedRun run{installation.Machine("desktop.toml"), person, 1, {}, {"-subtest=LEDTest"}};
  run.arguments.insert(run.arguments.end(), arguments.begin(), arguments.end());
  return run;
}

TEST(SystemLedTest, EachKindOfOperatorGetsHisVerdictByTheStartButtonAndTheFixedButtons) {
  const Lines leds = {"-NumLock=true", "-CapsLock=true", "-MultiColorPowerLED=true", "-Retries=0"};
  struct Case {
    const char* person;
    int exitCode;
    Lines reports;
  };
  // A failed LED has no code but that of its kind, and no exception follows.
  for (const Case& c : {Case{"perfect", 0, {}}, Case{"slow:9", 0, {}}, Case{"silent", 1, {"ReportFailure 770118"}},
                        Case{"cancel", 1, {"ReportFailure 990354"}}, Case{"wrong:9", 0, {}}}) {
    const Installation installation;
    const SimulatedRun run = RunOf(installation, leds, c.person);
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, c.exitCode) << outcome.output << outcome.errors;
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.Tagged("ReportFailure"), c.reports);
    EXPECT_THAT(outcome.Tagged("TestFailed"), IsEmpty());
    EXPECT_THAT(outcome.output, Not(HasSubstr("Thread Exited")));
    EXPECT_THAT(outcome.output, Not(HasSubstr("DeviceID")));
    EXPECT_THAT(outcome.LeftChanged(), IsEmpty());
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

TEST(SystemLedTest, DrivesFloppyCameraAndLinkBlinkByWhatReallyLightsThem) {
  struct Case {
    const char* machine;
    Lines leds;
    std::vector<const char*> lamps;
  };
  for (const Case& c : {Case{"drives-desktop.toml",
                             {"-HDDOnControllers=all", "-FloppyDrv=true", "-NetworkLED=true"},
                             {"sata-drive", "sas-drive", "nvme-drive", "floppy-drive", "network"}},
                        Case{"drives-desktop.toml", {"-HDDOnControllers=any"}, {"sata-drive"}},
                        Case{"drives-desktop.toml", {"-IDEHardDrive=true"}, {"sata-drive"}},
                        Case{"office-notebook.toml", {"-WebcamLED=true"}, {"camera"}}}) {
    const Installation installation;
    SimulatedRun run = RunOf(installation, c.leds, "perfect");
    run.machine = installation.Machine(c.machine);
    run.arguments.emplace_back("-Retries=0");
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
    for (const char* lamp : c.lamps) {
      EXPECT_GE(outcome.TimesLit(lamp), 2U) << lamp;
    }
    EXPECT_THAT(outcome.leftBehind, IsEmpty());
  }
}

TEST(SystemLedTest, WithoutALedThereIsNothingToTest) {
  for (const Lines& arguments : {Lines{}, Lines{"-NoLED=true"}, Lines{"-AcknowledgeRetry=true"}}) {
    const Installation installation;
    const Outcome outcome = RunOf(installation, arguments, "perfect").In(installation);
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_THAT(outcome.Tagged("TestFailed"), ElementsAre("TestFailed 990471 \"\""));
    EXPECT_THAT(outcome.output, HasSubstr("LogMessage 7 16 \"\" \"\"\nTestFailed"));
    EXPECT_THAT(outcome.output, Not(HasSubstr("UpdatePercentage 5\n")));
  }
}

// The script presses start, then buttons of which one has no kind; a start that nobody presses runs into no time-out.
TEST(SystemLedTest, NoTimeRunsBeforeTheStartAndAButtonWithoutAKindIsAWrongAnswer) {
  const Installation installation;
  installation.Write("presses.txt", "120000 1000\n123000 1005\n");
  const SimulatedRun run =
      RunOf(installation, {"-NumLock=true", "-Retries=0", "-LEDTimeout=10"}, "script:presses.txt");
  const Outcome outcome = run.In(installation);
  EXPECT_THAT(outcome.Tagged("ReportFailure"), ElementsAre("ReportFailure 770102"));
  EXPECT_GT(outcome.end_us, 123'000'000U);
  EXPECT_LT(outcome.end_us, 128'000'000U);
}

}  // namespace
}  // namespace panelglow::systemtest
