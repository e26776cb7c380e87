// Many seeds over operators, machines and faults: what must hold of every run.
#include <gmock/gmock.h>

#include <random>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

struct Panel {
  const char* machine;
  const char* section;
  std::vector<std::string> leds;
  bool restoresRegisters;
};

const std::vector<Panel> kPanels = {
    {"desktop.toml", "Desktop", {"power-green", "power-red", "drive-red", "num-lock", "caps-lock"}, true},
    {"notebook.toml", "Notebook", {"power-white", "charge-amber", "touchpad", "num-lock", "caps-lock"}, true},
    {"notebook.toml", "Everything", {"power-white", "power-amber", "scroll-lock"}, true},
    {"unknown-board.toml", "Default", {"power-green", "num-lock"}, false},
};
const std::vector<std::string> kPersons = {"perfect", "wrong:2", "slow:9",  "cancel:2",   "silent",
                                           "random",  "first",   "slow:40", "elimination"};
const std::vector<std::string> kFaults = {"dead", "stuck", "wrong-color", "inverted", "lying-write", "absent-chip"};
const std::vector<std::string> kEvents = {
    "",
    "",
    "\n[[event]]\nat_ms = 9000\nconsole = 0\n",
    "\n[[event]]\nat_ms = 21000\nwrite_file = '\\kill.ctl'\n",
    "\n[[event]]\nat_ms = 2500\nfill_disk = true\n",
    "\n[[peer]]\nmutex = '_HalcyonMotherBoardLib'\nfrom_ms = 4000\nuntil_ms = 12000\n",
    "\n[[peer]]\nmutex = '_HalcyonPromptLock'\nfrom_ms = 1\nuntil_ms = 30000\n"};

TEST(SystemCampaign, EveryRunKeepsItsPromises) {
  const Installation installation;
  for (const unsigned seed : Seeds(40)) {
    std::mt19937 dice(seed);
    const auto pick = [&](const auto& list) { return list[dice() % list.size()]; };
    const Panel panel = pick(kPanels);
    SimulatedRun run =
        LedRun(installation.Machine(panel.machine, pick(kEvents) + "\n"), panel.section,
               {"-Retries=" + std::to_string(dice() % 3), "-DataCollectionFile=log.xml"}, pick(kPersons), seed);
    if (dice() % 2 == 0) {
      run.faults = {pick(panel.leds) + "=" + pick(kFaults)};
    }
    SCOPED_TRACE(run.Describe() + "\nmachine:\n" + installation.Read("machine.toml"));
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.exitCode == 0 || outcome.exitCode == 1) << outcome.errors;
    EXPECT_TRUE(outcome.IsOrderly()) << outcome.output;
    EXPECT_TRUE(outcome.end_us > 0) << outcome.errors;  // no deadlock
    EXPECT_EQ(outcome.exitCode == 0, outcome.Tagged("TestFailed").empty() && outcome.Tagged("ReportFailure").empty());
    if (panel.restoresRegisters) {
      EXPECT_THAT(outcome.leftBehind, ::testing::IsEmpty());
    }
  }
  // All runs wrote to the one log, which stayed whole.
  const std::string log = installation.Read("log.xml");
  EXPECT_THAT(log, ::testing::EndsWith("</DiagnosticsData>\n"));
}

}  // namespace
}  // namespace panelglow::systemtest
