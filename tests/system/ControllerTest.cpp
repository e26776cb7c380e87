// The reference controller as people call it, and the product on a machine without its hardware.
#include <gmock/gmock.h>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

Outcome Controller(const Installation& installation, const std::vector<std::string>& arguments) {
  return RunProgram("panelglow-sim", arguments, installation.Path(""), {});
}

TEST(SystemController, ItsExitCodesTellAWrongCallFromABrokenRun) {
  const Installation installation;
  const std::string machine = installation.Machine("desktop.toml");
  installation.Write("broken.toml", "[[chip]]\n");
  struct Case {
    std::vector<std::string> arguments;
    int exitCode;
    const char* error;
  };
  const std::vector<Case> kCases = {
      {{"--help"}, 0, ""},
      {{}, 2, "--machine is required"},
      {{"--machine", machine, "--operator", "nobody"}, 2, "there is no operator \"nobody\" (perfect"},
      {{"--machine", machine, "--fault", "caps-lock"}, 2, "must have the form LED=KIND"},
      {{"--machine", machine, "--fault", "caps-lock=wet"}, 2, "there is no fault \"wet\" (dead"},
      {{"--machine", machine, "--fault", "caps-lock=swapped:none"}, 2, "none"},
      {{"--machine", machine, "--seed", "many"}, 2, "--seed"},
      {{"--machine", machine, "--seed=-1"}, 2, "--seed"},
      {{"--machine", "."}, 3, "the machine's file . cannot be read"},
      {{"--machine", machine, "--trace", "/dev/full", "--", "-subtest=CustomLEDTest"},
       3,
       "the trace file /dev/full did not take everything"},
      {{"--machine", "none.toml"}, 3, "none.toml cannot be read"},
      {{"--machine", "broken.toml"}, 3, "broken.toml:1: \"chip.name\" is missing"},
      {{"--machine", machine, "--raw", "--", "-subtest=None"}, 1, ""},
      {{"--machine", machine, "--", "-subtest=CustomLEDTest"}, 0, ""},
  };
  for (const Case& c : kCases) {
    const Outcome outcome = Controller(installation, c.arguments);
    EXPECT_EQ(outcome.exitCode, c.exitCode) << ::testing::PrintToString(c.arguments);
    EXPECT_THAT(outcome.errors, HasSubstr(c.error));
  }
}

TEST(SystemController, AVerdictThatNobodyCouldReadIsNone) {
  const Installation installation;
  installation.Write("full.sh", "exec " PANELGLOW_BINARY_DIR "/panelglow-sim --machine " +
                                    installation.Machine("desktop.toml") +
                                    " -- -subtest=CustomLEDTest > /dev/full\n");
  const Outcome full = RunProgram("/bin/sh", {"full.sh"}, installation.Path(""), {});
  EXPECT_EQ(full.exitCode, 1);
  EXPECT_THAT(full.errors, HasSubstr("panelglow-sim: standard output did not take everything"));
}

TEST(SystemController, APersonSeesProgressThePanelAndTheVerdict) {
  const Installation installation;
  const Outcome outcome =
      Controller(installation, {"--machine", installation.Machine("desktop.toml"), "--fault", "power-green=dead",
                                "--trace", "trace.txt", "--screenshots", "pictures", "--", "-subtest=CustomLEDTest",
                                "-Retries=0", "-SectionID=Desktop"});
  EXPECT_THAT(outcome.output, HasSubstr("  50 %\n"));
  EXPECT_THAT(outcome.output, HasSubstr("green, power-gpio.0, lit 0 times, FAULT: dead\n"));
  EXPECT_THAT(outcome.output,
              EndsWith("FAILED: the green power LED was not recognised [ReportFailure 770133]; the code that the "
                       "installation gives this button [TestFailed 771017 \"\"] (exit code 1)\n"));
  EXPECT_THAT(outcome.output, HasSubstr(" presses \"Num Lock\" (1003)\n"));
  EXPECT_THAT(outcome.output, Not(HasSubstr("\x1B")));  // no colour where no terminal is
  EXPECT_THAT(installation.Read("trace.txt"), HasSubstr("0A20"));
  EXPECT_THAT(installation.Read("pictures/01-prompt.png"), StartsWith("\x89PNG"));
  EXPECT_GT(installation.Read("pictures/01-prompt.png").size(), 2000U);
}

TEST(SystemController, TheProductWithoutItsDriverSaysSoWhateverTheEnvironmentHolds) {
  const Installation installation;
  const Outcome outcome = RunProgram(
      "panelglow-diags", {"-subtest=CustomLEDTest"}, installation.Path(""),
      {{"PANELGLOW_SIM_MACHINE", installation.Machine("desktop.toml")}, {"PANELGLOW_SIM_OPERATOR", "perfect"}});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_TRUE(outcome.IsOrderly());
  EXPECT_THAT(outcome.output, HasSubstr("LogMessage 7 17 \"\" \"\"\nTestFailed 020472 \"\"\n"));
}

TEST(SystemController, TheWholeOutputOfARun) {
  const Installation installation;
  const Outcome raw =
      Controller(installation, {"--machine", installation.Machine("desktop.toml"), "--operator", "wrong:2", "--seed",
                                "1", "--raw", "--", "-subtest=CustomLEDTest", "-SectionID=Default", "-Retries=1",
                                "-debug=true", "-OperatorCheating=false"});
  EXPECT_EQ(raw.output, Golden("wrong-then-right.golden"));
}

}  // namespace
}  // namespace panelglow::systemtest
