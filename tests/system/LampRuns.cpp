#include "system/LampRuns.h"

#include <gmock/gmock.h>

namespace panelglow::systemtest {

using ::testing::IsEmpty;

namespace {

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

}  // namespace

std::string Board::Name() const {
  std::string name = machine;
  for (const Edit& edit : edits) {
    name += edit.wrong.find('\n') + 1 < edit.wrong.size() ? "" : ", " + edit.wrong;
  }
  return name;
}

std::string Prepare(const Installation& installation, const Board& board, const std::string& events) {
  installation.Write("machine.toml", installation.Read(installation.Machine(board.machine)) + events);
  for (const Edit& edit : board.edits) {
    installation.Replace(edit.file, edit.right, edit.wrong);
  }
  return installation.Path("machine.toml").string();
}

void ExpectLampsBlink(const Board& board) {
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

void ExpectStoppedRunsPutBack(const Board& board) {
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

void ExpectSignal(const Board& board) {
  const Installation installation;
  const SimulatedRun run{Prepare(installation, board), "", 1, {}, {"-subtest=LEDStatusIndicator", "-BlinkTime=1"}};
  SCOPED_TRACE(board.Name());
  const Outcome outcome = run.In(installation);
  if (board.hasSignal) {
    EXPECT_EQ(outcome.exitCode, 0);
    ExpectNothingLeft(outcome);
    EXPECT_GE(outcome.TimesLit("power-green"), 20U);
    return;
  }
  EXPECT_TRUE(outcome.IsOrderly());
  EXPECT_EQ(outcome.TimesLit("power-green"), 0U);
  EXPECT_TRUE(outcome.errors.find("cannot be lit") != std::string::npos ||
              !outcome.Tagged("TestFailed 990431").empty())
      << outcome.errors;
  EXPECT_THAT(outcome.leftBehind, IsEmpty());
}

}  // namespace panelglow::systemtest
