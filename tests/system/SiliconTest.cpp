// Whole runs on the machines whose lamps hang on Super-I/Os, embedded controllers and codecs: what the panel shows,
// what a run leaves behind, and how it ends when the silicon is ill or the INI files are wrong.
#include <gmock/gmock.h>

#include <algorithm>
#include <map>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

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
};

// A chip that blinks by itself keeps exact time. One that the program toggles has phases of 500 ms and what its
// writes take: a level port 30 ms each, the mailbox 50 ms each, the codec 10 ms and more for each of three verbs, and
// an embedded controller asked by the generic class the 8 ms for which its idle output buffer is watched in vain.
const std::vector<Machine>& Machines() {
  static const std::vector<Machine> kMachines = {
      {"sio-ite.toml", "TwoColorPower", {{"power-green", 500, 500, 0}, {"power-red", 500, 500, 0}}},
      {"sio-fintek.toml", "TwoColorPower", {{"power-green", 500, 500, 0}, {"power-red", 500, 500, 0}}},
      {"sio-generic.toml", "TwoColorPower", {{"power-green", 530, 560, 2}, {"power-red", 530, 560, 2}}},
      {"ec-notebook.toml", "EcNotebook", {{"power-white", 508, 508, 2}, {"power-amber", 508, 508, 2}}},
      {"ec16-notebook.toml", "EcNotebook", {{"power-white", 510, 510, 2}, {"power-amber", 510, 510, 2}}},
      {"old-ec.toml", "TwoColorPower", {{"power-green", 500, 500, 2}, {"power-red", 500, 500, 2}}},
      {"mailbox-notebook.toml",
       "MailboxNotebook",
       {{"power-white", 550, 550, 2}, {"charge-white", 800, 800, 2}, {"charge-amber", 800, 800, 2}}},
      {"codec-notebook.toml", "CodecNotebook", {{"speaker-mute", 570, 570, 2}, {"microphone-mute", 570, 570, 2}}},
      {"casl-notebook.toml", "FirmwareNotebook", {{"power-white", 500, 500, 2}}},
  };
  return kMachines;
}

const char* const kConfigurationLeftOpen = "after mailbox configuration mode = open";

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

std::vector<std::string> LampTest(const char* section) {
  return {"-subtest=CustomLEDTest", std::string("-SectionID=") + section, "-Retries=0"};
}

// How long the run took in the machine's time.
std::uint64_t Seconds(const Installation& installation) {
  const std::string report = installation.Read("report.txt");
  const std::size_t at = report.find("\nend ");
  return at == std::string::npos ? 0 : std::stoull(report.substr(at + 5)) / 1'000'000;
}

TEST(SystemSilicon, EveryLampBlinksInItsTimeAndIsLeftAsItWas) {
  for (const Machine& machine : Machines()) {
    const Installation installation;
    const SimulatedRun run{installation.Machine(machine.file), "slow:5", 3, {}, LampTest(machine.section)};
    SCOPED_TRACE(run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
    EXPECT_TRUE(outcome.IsOrderly());
    for (const Lamp& lamp : machine.lamps) {
      EXPECT_GE(GoodPhases(outcome, lamp), 8U) << lamp.name;
    }
    std::map<std::string, std::pair<bool, bool>> lit;  // at first and at last
    for (const Edge& edge : outcome.edges) {
      lit[edge.led].first = edge.time_us == 0 ? edge.lit : lit[edge.led].first;
      lit[edge.led].second = edge.lit;
    }
    for (const auto& [name, state] : lit) {
      EXPECT_EQ(state.first, state.second) << name;
    }
    for (const std::string& line : outcome.leftBehind) {
      // The mailbox class opens its chip's configuration ports and does not close them.
      EXPECT_TRUE(machine.file == std::string("mailbox-notebook.toml") &&
                  line.find("mailbox configuration mode") != std::string::npos)
          << line;
    }
  }
}

// A machine's file with a fault behind one of its lines.
std::string IllMachine(const Installation& installation, const char* file, const std::string& line,
                       const std::string& fault) {
  std::string text = installation.Read(installation.Machine(file));
  const std::size_t at = text.find("\n" + line + "\n");
  EXPECT_NE(at, std::string::npos) << line;
  text.insert(at + line.size() + 2, "fault = \"" + fault + "\"\n");
  installation.Write("machine.toml", text);
  return installation.Path("machine.toml").string();
}

TEST(SystemSilicon, AStuckPartEndsTheRunWithItsLampsVerdict) {
  struct Case {
    const char* file;
    const char* section;
    const char* line;
    const char* fault;
    std::vector<std::string> failures;  // one of them; none: the lamps need no answer of the part
  };
  const Case kCases[] = {
      {"ec-notebook.toml", "EcNotebook", "kind = \"embedded-controller\"", "stuck-ibf", {"770133", "770134"}},
      {"ec-notebook.toml", "EcNotebook", "kind = \"embedded-controller\"", "stuck-obf", {}},
      {"ec16-notebook.toml", "EcNotebook", "kind = \"embedded-controller\"", "stuck-ibf", {"770133", "770134"}},
      {"old-ec.toml", "TwoColorPower", "kind = \"embedded-controller\"", "stuck-ibf", {"770133", "770134"}},
      {"old-ec.toml", "TwoColorPower", "kind = \"embedded-controller\"", "stuck-obf", {}},
      {"mailbox-notebook.toml",
       "MailboxNotebook",
       "kind = \"mailbox-controller\"",
       "stuck-busy",
       {"770133", "770148", "770149"}},
      {"codec-notebook.toml", "CodecNotebook", "kind = \"hda-codec\"", "stuck-busy", {"770146"}},
      {"casl-notebook.toml",
       "FirmwareNotebook",
       "[firmware_call]",
       "wrong-signature",
       {}},  // asked by no LED test yet
  };
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run{IllMachine(installation, c.file, c.line, c.fault), "perfect", 1, {}, LampTest(c.section)};
    SCOPED_TRACE(std::string(c.fault) + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.reported);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, c.failures.empty() ? 0 : 1);
    const std::vector<std::string> failures = outcome.Tagged("ReportFailure");
    ASSERT_EQ(failures.size(), c.failures.empty() ? 0U : 1U);
    if (!c.failures.empty()) {
      EXPECT_THAT(c.failures, Contains(failures.front().substr(std::string("ReportFailure ").size())));
    }
    EXPECT_GT(Seconds(installation), 0U);
    EXPECT_LT(Seconds(installation), 60U);
  }
}

TEST(SystemSilicon, AWrongWordInTheIniFilesShowsOnThePanelOrInWhatIsLeftBehind) {
  struct Case {
    const char* file;
    const char* section;
    const char* ini;
    const char* right;
    const char* wrong;
    int exitCode;
    const char* leftBehind;  // empty: nothing is
  };
  const Case kCases[] = {
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "0x87,0x01,0x55,0x55", "0x87,0x01,0x55,0xAA", 1, ""},
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "powerled.ldn=0x07", "powerled.ldn=0x04", 1, ""},
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "secondary.gpio=23", "secondary.gpio=24", 1, ""},
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "regs=0x26,0xC1,", "regs=0x26,", 0, "super-io device 07"},
      {"sio-fintek.toml", "TwoColorPower", "chip.ini", "exit.sequence=0xAA", "exit.sequence=undef", 0, "mode = open"},
      {"sio-fintek.toml", "TwoColorPower", "chip.ini", "powerled.ldn=0x0A", "powerled.ldn=0x06", 1, ""},
      {"ec-notebook.toml", "EcNotebook", "chip.ini", "0xA2:0x01,0xEE:0x00", "0xEE:0x00,0xA2:0x01", 1, ""},
      {"ec-notebook.toml", "EcNotebook", "chip.ini", "0xA2:0x00,0xEE:0x01", "undef", 0, "after ec lamps = (held)"},
      {"ec16-notebook.toml", "EcNotebook", "chip.ini", "sc.port=0x6C", "sc.port=0x66", 1, ""},
      {"mailbox-notebook.toml", "MailboxNotebook", "mbtest.ini", "waittime=50", "waittime=20", 1,
       kConfigurationLeftOpen},
      {"codec-notebook.toml", "CodecNotebook", "chip.ini", "set.sequence=0x00171600,", "set.sequence=", 1, ""},
      {"codec-notebook.toml", "CodecNotebook", "mbdetect.ini", "=0x001B0010", "=0x001B0014", 1, ""},
  };
  for (const Case& c : kCases) {
    const Installation installation;
    std::string text = installation.Read(c.ini);
    const std::size_t at = text.find(c.right);
    ASSERT_NE(at, std::string::npos) << c.right;
    for (std::size_t next = at; next != std::string::npos; next = text.find(c.right, next + 1)) {
      text.replace(next, std::string(c.right).size(), c.wrong);
    }
    installation.Write(c.ini, text);
    const SimulatedRun run{installation.Machine(c.file), "perfect", 2, {}, LampTest(c.section)};
    SCOPED_TRACE(std::string(c.wrong) + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.reported);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, c.exitCode);
    if (*c.leftBehind == '\0') {
      EXPECT_THAT(outcome.leftBehind, IsEmpty());
    } else {
      EXPECT_THAT(outcome.leftBehind, Contains(HasSubstr(c.leftBehind)));
    }
  }
}

TEST(SystemSilicon, ABrokenLampOfAnyFamilyIsFound) {
  for (const Machine& machine : Machines()) {
    for (const char* fault : {"dead", "absent-chip", "lying-write"}) {
      const Installation installation;
      const SimulatedRun run{installation.Machine(machine.file),
                             "perfect",
                             5,
                             {std::string(machine.lamps.back().name) + "=" + fault},
                             LampTest(machine.section)};
      SCOPED_TRACE(run.Describe());
      const Outcome outcome = run.In(installation);
      EXPECT_EQ(outcome.exitCode, 1);
      EXPECT_TRUE(outcome.IsOrderly());
      EXPECT_EQ(outcome.Tagged("ReportFailure").size(), 1U);
    }
  }
}

}  // namespace
}  // namespace panelglow::systemtest
