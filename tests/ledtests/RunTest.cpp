// Whole runs inside the process: how the button files are read.
#include <gmock/gmock.h>

#include <algorithm>
#include <fstream>

#include "harness/base/Notices.h"
#include "ledtests/Bench.h"

namespace panelglow::ledtest {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

void Write(const std::string& file, const std::string& content) { std::ofstream(file, std::ios::binary) << content; }

std::string Read(const std::string& file) {
  std::ostringstream text;
  text << std::ifstream(file, std::ios::binary).rdbuf();
  return text.str();
}

TEST(ButtonFiles, MergeIntoTheListOfButtons) {
  Bench bench("", "silent");
  Write("ui.xml", R"(<?xml version="1.0"?>
<UI>
  <Section ID="Other"><Button ID="PowerRed"/></Section>
  <Section ID="Bench">
    <Button ID="NumLock" Active="false"/>
    <Button ID="CAPSLOCK" Active="FALSE" ErrorCode="123456" MessageID="99" Caption="a note"/>
    <Button ID="NoSuchButton"/>
    <Button ID="HardDrive" ErrorCode="" Active="false">
      <Config Controller="All" LEDOnTime="250" LEDOffTime="0" LEDBlinkTime="7" Connector="X1" DeviceDescription="D"/>
    </Button>
  </Section>
</UI>)");
  bench.RunProgram();
  std::vector<std::string> merged;
  for (const ButtonDefStruct& b : bench.test.buttons) {
    merged.push_back(b.id + " " + b.function + " " + b.buttonIco + " " + b.buttonLParam + " " + b.errorCode + " " +
                     b.messageId + " " + (b.active ? "active" : "shown") + " [" + b.caption + b.controller +
                     b.connector + b.deviceDescription + std::to_string(b.ledOnTime) + " " +
                     std::to_string(b.ledOffTime) + " " + std::to_string(b.ledBlinkTime) + "]");
  }
  EXPECT_THAT(merged, ElementsAre("NumLock numlock spr_num.ico 1003 771003 28 shown [0 0 0]",
                                  "CAPSLOCK capslock spr_caps.ico 1006 123456 99 active [a note0 0 0]",
                                  "HardDrive hdgreen spr_hdrv.ico 1013 771013 38 shown [AllX1D250 0 7]"));
  EXPECT_EQ(bench.test.deviceCount, 1);
}

TEST(ButtonFiles, SetTheFunctionsTheCodesAndTheDriveSettings) {
  Bench bench;
  const auto add = [&](const char* function, const char* code, bool active, const char* controller, int on_ms) {
    ButtonDefStruct& button = bench.test.buttons.emplace_back();
    button.function = function;
    button.errorCode = code;
    button.active = active;
    button.controller = controller;
    button.ledOnTime = on_ms;
  };
  add("NumLock", "", true, "", 0);  // the first of its function gives the code, even an empty one
  add("numlock", "771003", true, "", 0);
  add("capslock", "771006", false, "", 0);
  add("none", "771001", true, "", 0);
  add("HDGreen", "771013", true, "Sata A,SAS b", 250);
  bench.test.MapButtonFunctionsToTests();
  EXPECT_THAT(bench.test.functions, ElementsAre("hdgreen", "numlock"));
  EXPECT_EQ(bench.test.hdControllers, "sata a,sas b");
  EXPECT_EQ(bench.test.GetErrorCodeFromButtonFunctions("numlock"), "");
  EXPECT_EQ(bench.test.GetErrorCodeFromButtonFunctions("capslock"), "771006");
  EXPECT_EQ(bench.test.GetErrorCodeFromButtonFunctions("webcam"), "770146");
  add("hdgreen", "", true, "ANY", 0);  // a later one wins; a time of 0 leaves what is there
  bench.test.MapButtonFunctionsToTests();
  EXPECT_EQ(bench.test.hdControllers, "all");
  EXPECT_EQ(bench.test.hdOnTime, 250);
  EXPECT_EQ(bench.test.hdOffTime, 500);
}

TEST(ButtonFiles, WithMoreButtonsThanTheDialogHasPlacesAreRefused) {
  Bench bench;
  std::string schema = Read("ui.xsd");  // one of an integrator's own that does not count
  Write("ui.xsd", schema.replace(schema.find("\"24\""), 4, "\"99\""));
  std::string buttons;
  std::string definitions;
  for (int i = 0; i < 25; ++i) {
    const std::string id = "ID=\"b" + std::to_string(i) + "\"";
    buttons += "<Button " + id + "/>";
    definitions += "<Button " + id + R"( Function="none" ButtonIco="no_led.ico" ButtonLParam="1001"/>)";
  }
  Write("ui.xml", R"(<UI><Section ID="Bench">)" + buttons + "</Section></UI>");
  Write("buttondefinition.xml", "<ButtonDefinitions>" + definitions + "</ButtonDefinitions>");
  const std::vector<std::string> lines = bench.RunProgram();
  EXPECT_THAT(lines, Contains(HasSubstr("The section \"Bench\" in the file .\\ui.xml has 25 buttons")));
  EXPECT_THAT(lines, Contains("TestFailed 990163 \"\""));
}

TEST(ButtonFiles, OfEveryFormThatIsAllowedAreTakenAndWhatIsOddIsTold) {
  Bench bench("", "silent");
  Notices::Forget();
  Write("ui.xml", R"(<Panels><Section ID="A section"/><Section ID="Bench">
    <Lamp ID="NumLock"/><Button/><Button ID=""/><Button ID="CapsLock"><Config LEDOnTime="1"/></Button>
    <Button ID="CapsLock"/><Button ID="Nobody"/></Section></Panels>)");
  std::string definitions = Read("buttondefinition.xml");
  for (std::size_t at = 0; (at = definitions.find("ButtonDefinitions")) != std::string::npos;) {
    definitions.replace(at, 17, "All");
  }
  Write("buttondefinition.xml", definitions);
  EXPECT_THAT(bench.RunProgram(), Contains("ReportFailure 770118"));
  EXPECT_EQ(bench.test.buttons.size(), 3U);
  const std::string place = " the section \"Bench\" of .\\ui.xml";
  EXPECT_THAT(bench.sim.Errors(), HasSubstr("The element \"Lamp\" of" + place + " is taken for a button"));
  EXPECT_THAT(bench.sim.Errors(), HasSubstr("A button of" + place + " has no ID"));
  EXPECT_THAT(bench.sim.Errors(), HasSubstr("The button \"CapsLock\" stands 2 times in" + place));
  EXPECT_THAT(bench.sim.Errors(), HasSubstr("The button with the ID \"Nobody\" in" + place + " is left out"));
  // An attribute that nobody knows is still an error, whatever the root's name.
  Write("ui.xml", R"(<Panels><Section ID="Bench"><Button ID="NumLock" Activ="false"/></Section></Panels>)");
  EXPECT_THAT(bench.RunProgram(), Contains("TestFailed 990163 \"\""));
}

// Another run in the same folder has the work file for five seconds; then the folder takes no file any more.
TEST(ButtonFiles, AreCheckedInTurnAndAlsoWhereNoCopyCanBeWritten) {
  std::string lock = (Bench::FolderPath() / "ui.xml.modif").string() + "_HalcyonFileParser";
  std::replace_if(
      lock.begin(), lock.end(), [](char c) { return c == '/' || c == '.'; }, '_');
  Bench bench("peer = {mutex = '" + lock + "', until_ms = 5000}\n", "silent");
  Write("ui.xml", R"(<UI><Section ID="Bench"><Button ID="NumLock"/></Section></UI>)");
  Write("ui.xml.modif", "the other run's");
  bench.After(4900, [&] { EXPECT_EQ(Read("ui.xml.modif"), "the other run's"); });
  bench.After(5100, [&] { EXPECT_FALSE(fs::exists("ui.xml.modif")); });
  EXPECT_THAT(bench.RunProgram(), Contains("UpdatePercentage 5"));
  bench.sim.DiskFiles().FillDisk();
  EXPECT_THAT(bench.RunProgram(), Contains("UpdatePercentage 5"));
}

}  // namespace
}  // namespace panelglow::ledtest
