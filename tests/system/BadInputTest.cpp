// Files and firmware as they should not be: a clear error, nothing lost, and always one end of test.
#include <gmock/gmock.h>

#include <filesystem>
#include <functional>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;

namespace fs = std::filesystem;

Outcome RunDesktop(const Installation& installation, const std::vector<std::string>& more = {},
                   const std::string& machineText = {}) {
  std::vector<std::string> arguments = {"-Retries=0"};
  arguments.insert(arguments.end(), more.begin(), more.end());
  return LedRun(installation.Machine("desktop.toml", machineText), "Desktop", arguments).In(installation);
}

std::string Repeated(const std::string& text, int times) {
  std::string all;
  while (times-- > 0) {
    all += text;
  }
  return all;
}

using Spoil = std::function<void(const Installation&)>;

Spoil Removing(const char* file) {
  return [file](const Installation& installation) { fs::remove(installation.Path(file)); };
}

Spoil Writing(const char* file, const std::string& content) {
  return [file, content](const Installation& installation) { installation.Write(file, content); };
}

Spoil Editing(const char* file, const char* from, const char* to) {
  return [=](const Installation& installation) {
    std::string text = installation.Read(file);
    const std::size_t at = text.find(from);
    ASSERT_NE(at, std::string::npos) << from;
    installation.Write(file, text.replace(at, std::string(from).size(), to));
  };
}

const std::string kHostileDocument =
    "<?xml version=\"1.0\"?>\n<!DOCTYPE UI [<!ENTITY a \"aaaaaaaaaa\"><!ENTITY b \"&a;&a;&a;&a;&a;&a;&a;&a;\">"
    "<!ENTITY c \"&b;&b;&b;&b;&b;&b;&b;&b;\"><!ENTITY d \"&c;&c;&c;&c;&c;&c;&c;&c;\">"
    "<!ENTITY e SYSTEM \"file:///etc/passwd\">]>\n<UI><Section ID=\"Desktop\">&d;&e;</Section></UI>";

TEST(SystemBadInput, EachSpoiledFileIsNamedWithItsCode) {
  const struct {
    const char* name;
    Spoil spoil;
    const char* code;     // of the TestFailed line
    const char* message;  // in the output
  } kCases[] = {
      {"no chip file", Removing("chip.ini"), "990100", "LogMessage 8 49 \".\\chip.ini\""},
      {"no detection file", Removing("mbdetect.ini"), "990100", "LogMessage 8 49 \".\\mbdetect.ini\""},
      {"no button file", Removing("ui.xml"), "990100", "LogMessage 8 61 \".\\ui.xml\""},
      {"no schema", Removing("buttondefinition.xsd"), "990100", "LogMessage 8 61 \".\\buttondefinition.xsd\""},
      {"no icon", Removing("spr_jaz.ico"), "990618", "LogMessage 7 61 \"spr_jaz.ico\""},
      {"empty document", Writing("ui.xml", ""), "990632", "Input file .\\ui.xml is corrupt or cannot be found."},
      {"binary document", Writing("ui.xml", std::string("\0\1\2\xFF<", 5)), "990632",
       "Input file .\\ui.xml is corrupt"},
      {"truncated document", Writing("buttondefinition.xml", "<Buttons><Button ID=\"a"), "990632",
       "Input file .\\buttondefinition.xml is corrupt"},
      {"entities", Writing("ui.xml", kHostileDocument), "990632", "Input file .\\ui.xml is corrupt"},
      {"100,000 levels", Writing("ui.xml", Repeated("<a>", 100'000) + Repeated("</a>", 100'000)), "990632",
       "Input file .\\ui.xml is corrupt"},
      {"unknown attribute",
       Editing("ui.xml", "<Button ID=\"CapsLock\"/>", "<Button ID=\"CapsLock\" Colour=\"red\"/>"), "990163",
       "Colour"},
      {"five-digit code", Editing("buttondefinition.xml", "771003", "77100"), "990163", "77100"},
      {"command that is no number", Editing("buttondefinition.xml", "\"1003\"", "\"10O3\""), "990163", "10O3"},
      {"broken schema", Writing("ui.xsd", "<xs:schema"), "990163", ".\\ui.xml is not proper"},
      {"bad sequence", Editing("chip.ini", "0xA20:0x01", "0xA20"), "995205",
       "malformed sequence entry: '0xa20'. should be: 'cmd:data[.data]*,...'"},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.name);
    const Installation installation;
    c.spoil(installation);
    const Outcome outcome = RunDesktop(installation, {"-DataCollectionFile=log.xml"});
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_TRUE(outcome.IsOrderly()) << outcome.output;
    ASSERT_EQ(outcome.Tagged("TestFailed").size(), 1U) << outcome.output;
    EXPECT_THAT(outcome.Tagged("TestFailed").front(), HasSubstr(std::string("TestFailed ") + c.code));
    EXPECT_THAT(outcome.output, HasSubstr(c.message));
    EXPECT_THAT(outcome.output, Not(HasSubstr("root:")));
    EXPECT_THAT(installation.Read("log.xml"), HasSubstr("errorcode=\"" + std::string(c.code) + "\"/>"));
  }
}

TEST(SystemBadInput, ASchemaFailureLeavesTheWorkFileAndTheNextSuccessRemovesIt) {
  const Installation installation;
  const std::string good = installation.Read("ui.xml");
  Editing("ui.xml", "ID=\"NumLock\"", "Id=\"NumLock\"")(installation);
  RunDesktop(installation);
  EXPECT_TRUE(fs::exists(installation.Path("ui.xml.modif")));
  installation.Write("ui.xml", good);
  EXPECT_EQ(RunDesktop(installation).exitCode, 0);
  EXPECT_FALSE(fs::exists(installation.Path("ui.xml.modif")));
  EXPECT_EQ(installation.Read("ui.xml"), good);
}

TEST(SystemBadInput, ASectionThatDoesNotExistIsNamedWithItsFile) {
  const Outcome outcome = RunDesktop(Installation(), {"-SectionID=O'Brien & <Sons>"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_TRUE(outcome.IsOrderly());
  EXPECT_THAT(outcome.output, HasSubstr("There is no section \"O'Brien & <Sons>\" in the file .\\ui.xml"));
}

TEST(SystemBadInput, IniFilesThatMakeNoSenseAreAnUnknownMachine) {
  // The LEDs of this machine are then not where the program looks for them: they stay dark, and are found out.
  for (const std::string& content :
       {std::string(), std::string("\0\xFF\xFE\x80[", 5), "[7D10]\nchips=" + std::string(1'000'000, 'x')}) {
    const Installation installation;
    installation.Write("mbdetect.ini", content);
    const Outcome outcome = RunDesktop(installation);
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_THAT(outcome.Tagged("TestFailed"), ElementsAre(HasSubstr("TestFailed 7710")));
  }
}

TEST(SystemBadInput, NoMessageTextCanBreakARun) {
  for (const char* format : {"%n%n%n%n", "%s%s%s%s", "%", "100%", "%99999d%99999s", "%*.*s", "%S%c%p%x"}) {
    SCOPED_TRACE(format);
    const Installation installation;
    std::string texts = "[en_US]\n";
    for (const char* number : {"2", "3", "8", "20000", "23", "24", "57", "59", "60", "20011"}) {
      texts += std::string(number) + "=" + format + "\n";
    }
    installation.Write("panelglow-diags.msg", texts);
    installation.Write("nonui_panelglow-diags.msg", texts);
    const Outcome outcome = RunDesktop(installation, {"-debug=true"});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
    EXPECT_TRUE(outcome.IsOrderly());
  }
}

// Standard output on a full disk, and a reader that has gone: the run reaches its end, and does not count as a pass.
TEST(SystemBadInput, OutputThatNobodyGetsIsNoPass) {
  const fs::path program = fs::path(PANELGLOW_BINARY_DIR) / "panelglow-diags-sim";
  for (const auto& [redirection, reason] :
       {std::pair{">/dev/full", "No space left on device"}, {"| true", "Broken pipe"}}) {
    const Installation installation;
    const std::string machine = installation.Machine("desktop.toml");
    installation.Write("run.sh", "{ " + program.string() +
                                     " -subtest=CustomLEDTest -SectionID=Desktop -DataCollectionFile=log.xml; "
                                     "echo $? >code; } " +
                                     redirection + "\nexit \"$(cat code)\"\n");
    const Outcome outcome = RunProgram("/bin/sh", {"run.sh"}, installation.Path(""),
                                       {{"PANELGLOW_SIM_MACHINE", machine}, {"PANELGLOW_SIM_OPERATOR", "perfect"}});
    EXPECT_EQ(outcome.exitCode, 1) << redirection;
    EXPECT_THAT(outcome.errors, HasSubstr("Standard output did not take all lines (" + std::string(reason) + ")"));
    EXPECT_THAT(installation.Read("log.xml"), HasSubstr("status=\"1\""));
  }
}

TEST(SystemBadInput, ADataCollectionPathThatCannotBeWrittenLeavesTheVerdictAlone) {
  for (const auto& [path, machineText] :
       {std::pair{"folder", ""}, {"log.xml", "\n[[event]]\nat_ms = 3000\nfill_disk = true\n"}, {"   ", ""}}) {
    SCOPED_TRACE(path);
    const Installation installation;
    fs::create_directory(installation.Path("folder"));
    const Outcome outcome =
        RunDesktop(installation, {std::string("-DataCollectionFile=") + path, "-AutoStart=true"}, machineText);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
    EXPECT_TRUE(outcome.IsOrderly());
    EXPECT_THAT(outcome.output, Not(HasSubstr("written successfully")));
  }
}

// The program alone in a folder, without the components that lie beside it.
TEST(SystemBadInput, AMissingXmlComponentIsNoCorruptFile) {
  const Installation installation;
  fs::copy_file(fs::path(PANELGLOW_BINARY_DIR) / "panelglow-diags-sim", installation.Path("alone"));
  installation.Write("log.xml", "<DiagnosticsData/>");
  const Outcome outcome =
      RunProgram(installation.Path("alone").string(),
                 {"-subtest=CustomLEDTest", "-SectionID=Desktop", "-DataCollectionFile=log.xml", "-Retries=0"},
                 installation.Path(""), {{"PANELGLOW_SIM_MACHINE", installation.Machine("desktop.toml")}});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.Tagged("TestFailed"), ElementsAre(HasSubstr("990638")));
  EXPECT_THAT(outcome.output, Not(HasSubstr("corrupt")));
  EXPECT_THAT(outcome.errors, HasSubstr("libpanelglow-xml.so cannot be loaded"));
  EXPECT_THAT(outcome.errors, HasSubstr("log.xml is left as it is"));
  EXPECT_EQ(installation.Read("log.xml"), "<DiagnosticsData/>");
}

TEST(SystemBadInput, AMissingDrawingComponentIsToldOnceAndTheRunGoesOn) {
  const Installation installation;
  const fs::path programs = PANELGLOW_BINARY_DIR;
  fs::copy_file(programs / "panelglow-diags-sim", installation.Path("panelglow-diags"));
  fs::copy_file(programs / "../lib/libpanelglow-xml.so", installation.Path("libpanelglow-xml.so"));
  installation.Write("pictures.msg", "[all multimedia]\n24=.\\super.ico\n");  // of the first prompt and of the second
  SimulatedRun run = LedRun(installation.Machine("desktop.toml"), "Desktop",
                            {"-AutoStart=false", "-Retries=1", "-integratormsgfile=pictures.msg"}, "wrong:1");
  const Outcome outcome =
      RunProgram(installation.Path("panelglow-diags").string(), run.arguments, installation.Path(""),
                 {{"PANELGLOW_SIM_MACHINE", run.machine}, {"PANELGLOW_SIM_OPERATOR", run.person}});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
  EXPECT_TRUE(outcome.IsOrderly());
  const std::string told = "libpanelglow-drawing.so cannot be loaded";
  const std::size_t first = outcome.errors.find(told);
  ASSERT_NE(first, std::string::npos) << outcome.errors << outcome.output;
  EXPECT_EQ(outcome.errors.find(told, first + 1), std::string::npos) << outcome.errors;
}

}  // namespace
}  // namespace panelglow::systemtest
