// Whole runs on the machines with Super-I/Os, embedded controllers and codecs: how they end when the silicon is ill
// or the INI files are wrong.
#include <gmock/gmock.h>

#include <sstream>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

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
  const char* const ec = "kind = \"embedded-controller\"";
  const Case kCases[] = {
      {"ec-notebook.toml", "EcNotebook", ec, "stuck-ibf", {"770133", "770134"}},
      {"ec-notebook.toml", "EcNotebook", ec, "stuck-obf", {}},
      {"old-ec.toml", "TwoColorPower", ec, "stuck-ibf", {"770133", "770134"}},
      {"mailbox-notebook.toml",
       "MailboxNotebook",
       "kind = \"mailbox-controller\"",
       "stuck-busy",
       {"770133", "770148", "770149"}},
      {"codec-notebook.toml", "CodecNotebook", "kind = \"hda-codec\"", "stuck-busy", {"770146"}},
      {"casl-notebook.toml", "FirmwareNotebook", "[firmware_call]", "wrong-signature", {"770146"}},
  };
  constexpr std::uint64_t kLongest_us = 60'000'000;
  for (const Case& c : kCases) {
    const Installation installation;
    const SimulatedRun run = LedRun(IllMachine(installation, c.file, c.line, c.fault), c.section, {"-Retries=0"});
    SCOPED_TRACE(std::string(c.fault) + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, c.failures.empty() ? 0 : 1);
    const std::vector<std::string> failures = outcome.Tagged("ReportFailure");
    ASSERT_EQ(failures.size(), c.failures.empty() ? 0U : 1U);
    if (!c.failures.empty()) {
      EXPECT_THAT(c.failures, Contains(failures.front().substr(std::string("ReportFailure ").size())));
    }
    EXPECT_GT(outcome.end_us, 0U);
    EXPECT_LT(outcome.end_us, kLongest_us);
  }
}

// A wrong key, a skipped wait, a swapped order: the lamp stays dark, or something is left behind.
TEST(SystemSilicon, AWrongWordInTheIniFilesShowsOnThePanelOrInWhatIsLeftBehind) {
  struct Case {
    const char* file;
    const char* section;
    const char* ini;
    const char* right;
    const char* wrong;
    int exitCode = 1;
    const char* leftBehind = "";  // empty: nothing is
  };
  const Case kCases[] = {
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "0x87,0x01,0x55,0x55", "0x87,0x01,0x55,0xAA"},
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "powerled.ldn=0x07", "powerled.ldn=0x04"},
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "secondary.gpio=23", "secondary.gpio=24"},
      {"sio-ite.toml", "TwoColorPower", "chip.ini", "regs=0x26,0xC1,", "regs=0x26,", 0, "super-io device 07"},
      {"sio-fintek.toml", "TwoColorPower", "chip.ini", "exit.sequence=0xAA", "exit.sequence=undef", 0, "mode = open"},
      {"sio-fintek.toml", "TwoColorPower", "chip.ini", "powerled.ldn=0x0A", "powerled.ldn=0x06"},
      {"ec-notebook.toml", "EcNotebook", "chip.ini", "0xA2:0x01,0xEE:0x00", "0xEE:0x00,0xA2:0x01"},
      {"ec-notebook.toml", "EcNotebook", "chip.ini", "0xA2:0x00,0xEE:0x01", "undef", 0, "after ec lamps = (held)"},
      {"ec16-notebook.toml", "EcNotebook", "chip.ini", "sc.port=0x6C", "sc.port=0x66"},
      {"mailbox-notebook.toml", "MailboxNotebook", "mbtest.ini", "waittime=50", "waittime=20", 1, "mode = open"},
      {"codec-notebook.toml", "CodecNotebook", "chip.ini", "set.sequence=0x00171600,", "set.sequence="},
      {"codec-notebook.toml", "CodecNotebook", "mbdetect.ini", "=0x001B0010", "=0x001B0014"},
  };
  for (const Case& c : kCases) {
    const Installation installation;
    std::string text = installation.Read(c.ini);
    std::size_t at = text.find(c.right);
    ASSERT_NE(at, std::string::npos) << c.right;
    for (; at != std::string::npos; at = text.find(c.right, at + 1)) {
      text.replace(at, std::string(c.right).size(), c.wrong);
    }
    installation.Write(c.ini, text);
    const SimulatedRun run = LedRun(installation.Machine(c.file), c.section, {"-Retries=0"}, "perfect", 2);
    SCOPED_TRACE(std::string(c.wrong) + ": " + run.Describe());
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_EQ(outcome.exitCode, c.exitCode);
    if (*c.leftBehind == '\0') {
      EXPECT_THAT(outcome.leftBehind, IsEmpty());
    } else {
      EXPECT_THAT(outcome.leftBehind, Contains(HasSubstr(c.leftBehind)));
    }
  }
}

// Standard error is for what is odd: a machine with its sections is not, a board without them is.
TEST(SystemSilicon, AGoodRunTellsPeopleNothing) {
  const std::pair<const char*, const char*> kMachines[] = {
      {"desktop.toml", "Desktop"},
      {"notebook.toml", "Notebook"},
      {"sio-ite.toml", "TwoColorPower"},
      {"sio-fintek.toml", "TwoColorPower"},
      {"sio-generic.toml", "TwoColorPower"},
      {"ec-notebook.toml", "EcNotebook"},
      {"ec16-notebook.toml", "EcNotebook"},
      {"old-ec.toml", "TwoColorPower"},
      {"mailbox-notebook.toml", "MailboxNotebook"},
      {"codec-notebook.toml", "CodecNotebook"},
      {"casl-notebook.toml", "FirmwareNotebook"},
  };
  for (const auto& [file, section] : kMachines) {
    const Installation installation;
    const Outcome outcome = LedRun(installation.Machine(file), section).In(installation);
    EXPECT_EQ(outcome.exitCode, 0) << file;
    EXPECT_EQ(outcome.errors, "") << file;
  }
  const Installation installation;
  const Outcome unknown = LedRun(installation.Machine("unknown-board.toml"), "Desktop").In(installation);
  EXPECT_EQ(
      unknown.errors,
      "panelglow-diags: This machine's board is not known: its system id is \"7E40\", and section [7E40] is not "
      "in .\\mbdetect.ini and .\\mbtest.ini; without \"platform\" or \"chips\" there, a test that knows the "
      "ports of the oldest desktops uses them for power and drive.\n");
}

}  // namespace
}  // namespace panelglow::systemtest
