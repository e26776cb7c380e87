// Ill front panels: every kind of LED against every fault, answered by an operator who sees only the panel.
#include <gmock/gmock.h>

#include <array>
#include <cstdlib>
#include <set>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::Contains;
using ::testing::HasSubstr;

struct LedCase {
  std::string name;
  std::string device;
  std::string kindCode;    // ReportFailure
  std::string buttonCode;  // TestFailed
  // What a LED of a wrong colour makes the operator do: press the button of the LED that it now looks like, or wait
  // in vain for one that this machine has.
  bool looksLikeAnother;
  bool goesUnasked = false;  // without its device the test has no such LED
};

struct MachineCase {
  std::string file;
  std::string section;
  std::vector<LedCase> leds;
};

const std::vector<MachineCase>& Machines() {
  static const std::vector<MachineCase> kMachines = {
      {"desktop.toml",
       "Desktop",
       {{"power-green", "power-gpio", "770133", "771017", true},
        {"power-red", "power-gpio", "770134", "771020", true},
        {"drive-red", "drive-gpio", "770132", "771016", false},
        {"num-lock", "keyboard", "770102", "771003", false},
        {"caps-lock", "keyboard", "770101", "771006", false},
        {"scroll-lock", "keyboard", "770100", "771009", false}}},
      {"notebook.toml",
       "Notebook",
       {{"power-white", "chipset-gpio", "770133", "771017", false},
        {"power-amber", "chipset-gpio", "770134", "771020", false},
        {"charge-white", "chipset-gpio", "770148", "771012", false},
        {"charge-amber", "chipset-gpio", "770149", "771015", false},
        {"touchpad", "keyboard", "770146", "771025", false},
        {"num-lock", "keyboard", "770102", "771003", false}}},
      {"ec-notebook.toml",
       "EcNotebook",
       {{"power-white", "ec", "770133", "771017", false}, {"power-amber", "ec", "770134", "771020", false}}},
      {"unknown-board.toml",
       "Desktop",
       {{"power-green", "panel", "770133", "771017", true}, {"drive-red", "panel", "770132", "771016", false}}},
      {"drives-desktop.toml",
       "DrivesDesktop",
       {{"sata-drive", "sata-disk", "770106", "771013", false, true},
        {"power-green", "power-gpio", "770133", "771017", true},
        {"network", "ethernet", "770146", "771018", false}}},
      {"office-notebook.toml",
       "OfficeNotebook",
       {{"drive", "disk", "770106", "771013", false, true},
        {"wireless", "wireless", "770146", "771018", false},
        {"camera", "camera", "770147", "771024", false}}},
      {"casl-notebook.toml",
       "FirmwareNotebook",
       {{"wireless", "firmware", "770146", "771018", false},
        {"power-white", "chipset-gpio", "770133", "771017", false}}},
  };
  return kMachines;
}

// What a run with a fault may end with. Which LED of several it is depends on the order, which is the seed's.
struct Expectation {
  bool passes = false;
  std::set<std::string> failures;     // ReportFailure
  std::set<std::string> buttonCodes;  // TestFailed
};

void AddWrongAnswer(Expectation& expected, const LedCase& led) {
  expected.failures.insert(led.kindCode);
  expected.buttonCodes.insert(led.buttonCode);
}

constexpr const char* kTimeOut = "770118";

Expectation Expect(const MachineCase& machine, const LedCase& led, const LedCase& partner, const std::string& fault) {
  Expectation expected;
  if (fault == "inverted" || (fault == "absent-chip" && led.goesUnasked)) {
    expected.passes = true;  // an inverted one blinks all the same: no blink test can tell
  } else if (fault == "dead" || fault == "stuck") {
    AddWrongAnswer(expected, led);
  } else if (fault == "wrong-color") {
    AddWrongAnswer(expected, led);
    if (!led.looksLikeAnother) {
      expected.failures.insert(kTimeOut);  // or nothing blinks any more: a lock key's 50 blinks are over in 20 s
    }
  } else if (fault == "swapped") {
    AddWrongAnswer(expected, led);
    AddWrongAnswer(expected, partner);
  } else if (fault == "shorted") {
    AddWrongAnswer(expected, led);  // one that is lit all the time hides the other's blinking
    AddWrongAnswer(expected, partner);
    expected.failures.insert(kTimeOut);
  } else {
    for (const LedCase& other : machine.leds) {  // a chip that is absent, or a register, may serve several
      if (other.name == led.name || other.device == led.device) {
        AddWrongAnswer(expected, other);
      }
    }
    if (led.device == "keyboard") {
      expected.failures.insert({"770100", "770101", "770102", "770146"});
      expected.buttonCodes.insert({"771003", "771006", "771009", "771025"});
    }
    if (led.device == "panel") {
      expected.failures.insert("770134");
      expected.buttonCodes.insert("771020");
    }
  }
  return expected;
}

std::string CodeOf(const Outcome& outcome, const std::string& tag) {
  const std::vector<std::string> lines = outcome.Tagged(tag);
  return lines.empty() ? std::string() : lines.front().substr(tag.size() + 1, 6);
}

void CheckRun(const MachineCase& machine, const LedCase& led, const LedCase& partner, const std::string& fault) {
  const bool needsPartner = fault == "swapped" || fault == "shorted";
  const Installation installation;
  SimulatedRun run = LedRun(installation.Machine(machine.file), machine.section,
                            {"-Retries=0", "-DataCollectionFile=log.xml"}, "perfect", 11);
  run.faults = {led.name + "=" + fault + (needsPartner ? ":" + partner.name : "")};
  SCOPED_TRACE(run.Describe());
  const Expectation expected = Expect(machine, led, partner, fault);
  const Outcome outcome = run.In(installation);
  EXPECT_TRUE(outcome.IsOrderly());
  EXPECT_EQ(outcome.exitCode, expected.passes ? 0 : 1);
  const std::string log = installation.Read("log.xml");
  if (expected.passes) {
    EXPECT_THAT(log, HasSubstr("<Attempt number=\"0\" errorcode=\"0\"/>"));
  } else {
    const std::string failure = CodeOf(outcome, "ReportFailure");
    EXPECT_THAT(expected.failures, Contains(failure));
    EXPECT_THAT(expected.buttonCodes, Contains(CodeOf(outcome, "TestFailed")));
    // The attempt is recorded with the LED's own code, also when its time ran out.
    EXPECT_THAT(log, HasSubstr("<Attempt number=\"0\" errorcode=\"770"));
    if (failure != kTimeOut) {
      EXPECT_THAT(log, HasSubstr("errorcode=\"" + failure + "\"/>"));
    }
  }
  for (const std::string& name : outcome.LeftChanged()) {
    EXPECT_TRUE(name == led.name || name == partner.name) << name << " is left in another state";
  }
}

// Of the LEDs behind one device the first meets every fault, the others one of them, in turn; all of them meet all
// where more seeds are wanted.
TEST(SystemFault, EveryKindOfLedAgainstEveryFault) {
  constexpr std::array<const char*, 8> kFaults = {"dead",    "stuck",    "wrong-color", "swapped",
                                                  "shorted", "inverted", "lying-write", "absent-chip"};
  const bool isLong = std::getenv("PANELGLOW_CAMPAIGN_SEEDS") != nullptr;
  for (const MachineCase& machine : Machines()) {
    std::set<std::string> met;
    for (std::size_t i = 0; i < machine.leds.size(); ++i) {
      const LedCase& partner = machine.leds[(i + 1) % machine.leds.size()];
      const bool isFirst = met.insert(machine.leds[i].device).second;
      for (std::size_t fault = 0; fault < kFaults.size(); ++fault) {
        if (isLong || isFirst || fault == i % kFaults.size()) {
          CheckRun(machine, machine.leds[i], partner, kFaults[fault]);
        }
      }
    }
  }
}

// A part that is ill by itself: a drive, a camera, a link, or silicon that no longer answers. Reading alone keeps a
// drive's lamp busy; what takes much longer than a phase is no blinking any more.
TEST(SystemFault, IllDrivesCamerasLinksAndSilicon) {
  struct Case {
    const char* machine;
    const char* section;
    const char* key;  // in the machine's file, with the fault in its place
    const char* ill;
    const char* failure;           // the code, or those of which it is one; empty: it blinks all the same
    const char* leaves = nullptr;  // part of what cannot be put back
  };
  constexpr std::uint64_t kLongest_us = 60'000'000;
  constexpr const char* kDisk = "name = \"sata-disk\"";
  constexpr const char* kCamera = "build_ms = 800";
  constexpr const char* kEc = "kind = \"embedded-controller\"";
  constexpr const char* kLink = "device_name = \"Bench Wireless-AC 8265\"";
  for (const Case& c : {
           Case{"drives-desktop.toml", "DrivesDesktop", kDisk, "fault = \"no-open\"", "770106"},
           Case{"drives-desktop.toml", "DrivesDesktop", kDisk, "fault = \"read-error\"", ""},
           Case{"drives-desktop.toml", "DrivesDesktop", kDisk, "fault = \"write-error\"", ""},
           Case{"drives-desktop.toml", "DrivesDesktop", kDisk, "fault = \"slow\"", "770106"},
           Case{"drives-desktop.toml", "DrivesDesktop", kDisk, "gone_ms = 2500", "770106"},
           Case{"office-notebook.toml", "OfficeNotebook", kCamera, "fault = \"bind\"", "770147"},
           Case{"office-notebook.toml", "OfficeNotebook", kCamera, "fault = \"render\"", "770147"},
           Case{"office-notebook.toml", "OfficeNotebook", kCamera, "fault = \"run\"", "770147"},
           Case{"office-notebook.toml", "OfficeNotebook", kCamera, "build_ms = 4000", ""},
           Case{"office-notebook.toml", "OfficeNotebook", kCamera, "gone_ms = 5000", "770147"},
           Case{"office-notebook.toml", "OfficeNotebook", kLink, "fault = \"stays-down\"", "770146", "wireless"},
           Case{"office-notebook.toml", "OfficeNotebook", kLink, "fault = \"stays-up\"", "770146"},
           Case{"office-notebook.toml", "OfficeNotebook", kLink, "fault = \"no-properties\"", ""},
           Case{"ec-notebook.toml", "EcNotebook", kEc, "fault = \"stuck-ibf\"", "770133 770134"},
           Case{"ec-notebook.toml", "EcNotebook", kEc, "fault = \"stuck-obf\"", ""},
           Case{"old-ec.toml", "TwoColorPower", kEc, "fault = \"stuck-ibf\"", "770133 770134"},
           Case{"mailbox-notebook.toml", "MailboxNotebook", "kind = \"mailbox-controller\"", "fault = \"stuck-busy\"",
                "770133 770148 770149", ""},
           Case{"codec-notebook.toml", "CodecNotebook", "kind = \"hda-codec\"", "fault = \"stuck-busy\"", "770146",
                ""},
           Case{"casl-notebook.toml", "FirmwareNotebook", "[firmware_call]", "fault = \"wrong-signature\"", "770146"},
       }) {
    const Installation installation;
    std::string text = installation.Read(installation.Machine(c.machine));
    const std::size_t at = text.find(c.key);
    ASSERT_NE(at, std::string::npos) << c.key;
    const std::string_view key = c.key;
    const bool replaces = std::string_view(c.ill).starts_with("build_ms");
    text.replace(at, key.size(), (replaces ? "" : std::string(key) + "\n") + c.ill);
    installation.Write("ill.toml", text);
    const SimulatedRun run = LedRun(installation.Path("ill.toml").string(), c.section, {"-Retries=0"}, "perfect", 3);
    SCOPED_TRACE(run.Describe() + " with " + c.ill);
    const Outcome outcome = run.In(installation);
    EXPECT_TRUE(outcome.IsOrderly());
    const std::string failure = CodeOf(outcome, "ReportFailure");
    EXPECT_EQ(failure.empty(), *c.failure == '\0') << outcome.output;
    EXPECT_THAT(c.failure, HasSubstr(failure));
    EXPECT_LT(outcome.end_us, kLongest_us);
    for (const std::string& line : outcome.leftBehind) {
      EXPECT_TRUE(c.leaves != nullptr && line.find(c.leaves) != std::string::npos) << line;
    }
  }
}

}  // namespace
}  // namespace panelglow::systemtest
