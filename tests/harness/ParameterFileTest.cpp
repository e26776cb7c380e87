// Parameter files: which set is taken, what is said about it, and who wins.
#include "harness/ParameterFile.h"

#include <gmock/gmock.h>

#include <stdexcept>

#include "harness/Probe.h"
#include "harness/base/CDMException.h"

namespace panelglow {
namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;

// The log lines of these texts.
std::string Logged(const std::vector<std::string>& texts) {
  std::string lines;
  for (const std::string& text : texts) {
    lines += "LogMessage 14 8 \"" + text + "\" \"\"\n";
  }
  return lines;
}

constexpr const char* kNames = "-subtest=Probe -paramfile=.\\sets.ini -paramsection=Set";

// What comes next: the run, or the first parameter that is refused.
constexpr const char* kRuns = "LogMessage 14 20000 \"diagnostic: ";
constexpr const char* kFileRefused = "LogMessage 15 20006 \"-paramfile\"";

const std::vector<std::string> kOfModel{"Checking section: 2A78_Set"};
const std::vector<std::string> kGeneral{"Checking section: 2A78_Set", "Section does not exist: 2A78_Set",
                                        "Checking section: Set"};

TEST(ParameterFile, TheSetOfTheModelGoesBeforeTheGeneralOneAndASetMayLieElsewhere) {
  struct Case {
    const char* content;
    const std::vector<std::string>& checked;
    std::vector<std::string> texts;
    const char* then = kRuns;  // behind these lines
  };
  const Case kCases[] = {
      {"[set]\n-level=1\n[2a78_SET]\n-level = 2\n-loud=false ; note\n",
       kOfModel,
       {"Reading parameters from section: 2A78_Set", "Read from INI file: -level=2",
        "Read from INI file: -loud=false ; note"},
       "LogMessage 15 20004 \"-loud\""},
      {"[2A78_Other]\n[Set]\nParamSet=Common ; for all\n[Common]\n-level=\"3\"\n",
       kGeneral,
       {"Reading parameters from section: Common", "Read from INI file: -level=\"3\""},
       "LogMessage 15 20005 \"-level\""},
      {"[Set]\nParamSet=\n-level=4\n",
       kGeneral,
       {"Reading parameters from section: Set", "Read from INI file: ParamSet=", "Read from INI file: -level=4"},
       "LogMessage 15 20003 \"paramset\""},
      {"[2A78_Set]\n; -level=4\n",
       kOfModel,
       {"Reading parameters from section: 2A78_Set", "WARNING: Section has no parameter listed: 2A78_Set"}},
      {"[2A78_Set]\n-mode=fast\n-MODE=slow\n-locale\n",
       kOfModel,
       {"Reading parameters from section: 2A78_Set", "Read from INI file: -mode=fast",
        "Read from INI file: -MODE=slow", "Ignored! Already exists on the command line: -mode",
        "Read from INI file: -locale"}},
      {"[2A78]\n[]\n",
       kGeneral,
       {"Section does not exist: Set", "ERROR! Sections not found: 2A78_Set, Set"},
       kFileRefused},
      {"[Set]\nParamSet=Common\n-level=4\n[Common]\n",
       kGeneral,
       {"ParamSet is provided: Common",
        "ERROR! Only one entry is expected in this section when ParamSet key has a value: Set",
        "Failed to process parameter file: .\\sets.ini"},
       kFileRefused},
      {"[Set]\nParamSet=Common\n",
       kGeneral,
       {"Reading parameters from section: Common", "ERROR! Section does not exist: Common"},
       kFileRefused},
      {"[Set]\nParamSet=a\"b\n",
       kGeneral,
       {"ERROR! Parameter file cannot be read: -1", "Failed to process parameter file: .\\sets.ini"},
       kFileRefused},
  };
  for (const Case& c : kCases) {
    ProbeRun run{kNames};
    run.boardProduct = "2A78 and more";
    run.files[".\\sets.ini"] = c.content;
    const std::string expected = Logged(c.checked) + Logged(c.texts);
    const std::string output = run.Output();
    EXPECT_THAT(output, StartsWith(expected + c.then));
  }
}

TEST(ParameterFile, WithoutFileOrSectionNothingIsReadAndInformationIsGivenAllTheSame) {
  const std::string both = "ERROR! -ParamFile and -ParamSection both must be blank or both must be provided";
  const std::pair<const char*, std::string> kCases[] = {
      {"-ParamFile=.\\sets.ini", Logged({both})},
      {"-paramsection=Set -paramfile=", Logged({both})},
      {"-paramfile=none.ini -paramsection=Set", Logged({"ERROR! Parameter file does not exist: none.ini"})},
      {"-paramfile= -paramsection=", ""},
  };
  for (const auto& [words, lines] : kCases) {
    ProbeRun run{words + std::string(" -version=true")};
    run.files[".\\sets.ini"] = "[Set]\n-version=false\n";
    EXPECT_EQ(run.Output(), lines + "C:\\suite\\probe.exe\nVersion: \n= 0") << words;
  }
}

TEST(ParameterFile, ItsLinesAreInDebugFormFromWhenDebugModeIsOnWithTheTextsOfTheLocaleThen) {
  ProbeRun run{"-subtest=Probe -paramfile=s.ini -paramsection=s"};
  run.files["s.ini"] = "[s]\n-debug=true\n-locale=de_DE\n-level=1\n";
  run.files["C:\\bench\\nonui_probe.msg"] = "[en_US]\n8=Parameters: %s\n20000=Free: %s\n[de_DE]\n8=Parameter: %s\n";
  const std::string output = run.Output();
  EXPECT_THAT(output, StartsWith("LogMessage 14 8 \"Checking section: _s\" \"\"\n"));
  EXPECT_THAT(output, HasSubstr("LogMessage 14 8 \"Read from INI file: -debug=true\" \"\"\n"
                                "LogMessage Debug Parameters: Read from INI file: -locale=de_DE \"\"\n"
                                "LogMessage Debug Parameter: Read from INI file: -level=1 \"\"\n"
                                "LogMessage Debug Free: diagnostic: "));
  run.words += " -debug=true -locale=de_DE";
  EXPECT_THAT(run.Output(), StartsWith("LogMessage Debug Parameter: Checking section: _s \"\"\n"));
}

TEST(ParameterFile, AModelThatCannotBeTakenFromTheFirmwareFailsTheFileWithItsReason) {
  CDMException table(990405);
  table.addMessage(LogOptions::Unknown, -1, "SMBIOS Exception");
  const std::pair<std::function<std::string()>, const char*> kCases[] = {
      {[&]() -> std::string { throw table; }, "990405 SMBIOS Exception"},
      {[]() -> std::string { throw std::string("WMIDiscovery Error: no service\n"); },
       "WMIDiscovery Error: no service"},
      {[]() -> std::string { throw std::length_error("too long"); }, "too long"},
  };
  for (const auto& [model, reason] : kCases) {
    platform::sim::Simulation machine(platform::sim::MachineDescription{}, {});
    machine.DiskFiles().Put("s.ini", "[s]\n-a=b\n");
    EXPECT_FALSE(ParameterFile("s.ini", "s", model).Read([](const std::string&) { FAIL(); }));
    EXPECT_EQ(machine.Output(), Logged({std::string("ERROR! Parameter file cannot be read: ") + reason,
                                        "Failed to process parameter file: s.ini"}));
    // The firmware is not asked about a file that is not there.
    EXPECT_FALSE(ParameterFile("none.ini", "s", model).Read([](const std::string&) { FAIL(); }));
  }
}

}  // namespace
}  // namespace panelglow
