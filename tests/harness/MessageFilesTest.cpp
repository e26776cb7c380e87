// From a message number to a text and a picture: which file answers, and when it is looked at.
#include "harness/MessageFiles.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <filesystem>

#include "harness/CmdLineParser.h"
#include "harness/OwnProcess.h"
#include "harness/base/Notices.h"
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;

constexpr const char* kProgram = "C:\\suite\\probe.exe";

// The text of a number, with "arg" put in.
std::string TextOf(const MessageFiles& files, int id) {
  return platform::Utf8FromWide(files.GetResourceString(id, u"arg"));
}

// The text and the picture, from a caller who passes `media` in.
std::string TextAndMedia(const MessageFiles& files, int id, wstring media = {}) {
  const wstring text = files.GetResourceString(id, u"arg", u"fallback", media);
  return platform::Utf8FromWide(text) + " | " + platform::Utf8FromWide(media);
}

class MessageFilesTest : public ::testing::Test {
 protected:
  void Put(const char* path, const char* content) { machine.DiskFiles().Put(path, content); }
  Simulation machine{MachineDescription{}, {}};
};

TEST_F(MessageFilesTest, TheFirstOfTheThreeFilesWithATextAnswers) {
  Put(".\\mine.msg", "[en_US]\n1=mine %s\n2=\n[de_DE]\n5=meins\n");
  Put("C:\\bench\\x_probe.msg", "[en_US]\n1=custom\n2=custom %s\n");
  Put("C:\\bench\\probe.msg", "[en_US]\n1=standard\n2=standard\n3=standard 100%% of %s and %s\n5=standard\n");
  Put("C:\\bench\\nonui_probe.msg", "[en_US]\n1=log %s\n[de_DE]\n1=Protokoll %s\n");
  const std::tuple<const char*, int, const char*> kCases[] = {
      {"en_US", 1, "mine arg"},  {"en_US", 2, "custom arg"}, {"en_US", 3, "standard 100% of arg and "},
      {"en_US", 4, "4 \"arg\""}, {"de_DE", 1, "mine arg"},   {"de_DE", 5, "meins"},
      {"fr_FR", 5, "standard"},  {"", 2, "custom arg"}};
  for (const auto& [locale, id, text] : kCases) {
    EXPECT_EQ(TextOf(MessageFiles(kProgram, ".\\mine.msg", locale), id), text) << locale << id;
  }
  EXPECT_EQ(TextOf(MessageFiles(kProgram, "", "en_US"), 1), "custom");
  EXPECT_EQ(MessageFiles(kProgram, "", "de_DE").ResolveLogMessage(1, "x"), "Protokoll x");
  EXPECT_EQ(MessageFiles(kProgram, "", "fr_FR").ResolveLogMessage(1, "x"), "log x");
}

TEST_F(MessageFilesTest, TheProgramsNameIsCutAtExeInLowerCaseOnly) {
  Put("C:\\bench\\probe.msg", "[en_US]\n1=lower\n");
  Put("C:\\bench\\probe.EXE.msg", "[en_US]\n1=upper\n");
  Put("C:\\bench\\probe.x.msg", "[en_US]\n1=inner\n");
  for (const auto& [program, text] : {std::pair{"probe", "lower"},
                                      {"..\\a.exe.d\\probe.exe.exe", "lower"},
                                      {"C:\\probe.EXE", "upper"},
                                      {"probe.x.exe", "inner"}}) {
    EXPECT_EQ(TextOf(MessageFiles(program, "", "en_US"), 1), text);
  }
}

TEST_F(MessageFilesTest, APictureIsTakenFromTheFirstFileThatHasItAndMustExist) {
  Put(".\\here.bmp", "");
  Put(".\\there.bmp", "");
  Put(".\\mine.msg", "[en_US]\n1=mine\n[all multimedia]\n2=.\\here.bmp\n3=.\\none.bmp\n4=\n");
  Put("C:\\bench\\x_probe.msg", "[en_US]\n2=custom\n[all multimedia]\n1=.\\there.bmp\n3=.\\there.bmp\n");
  Put("C:\\bench\\probe.msg", "[en_US]\n3=standard\n4=standard\n[all multimedia]\n1=.\\here.bmp\n5=.\\here.bmp\n");
  const MessageFiles files(kProgram, ".\\mine.msg", "en_US");
  EXPECT_EQ(TextAndMedia(files, 1), "mine | .\\there.bmp");
  EXPECT_EQ(TextAndMedia(files, 2), "custom | .\\here.bmp");
  EXPECT_EQ(TextAndMedia(files, 3), "standard | 3");  // an entry whose file does not exist
  EXPECT_EQ(TextAndMedia(files, 4), "standard | 4");
  EXPECT_EQ(TextAndMedia(files, 5), "fallback | .\\here.bmp");
  EXPECT_EQ(TextAndMedia(files, 6, u"old"), "fallback | ");  // the integrator's file is always asked
  EXPECT_EQ(machine.Errors(), "");
  EXPECT_EQ(TextAndMedia(MessageFiles(kProgram, "", "en_US"), 1, u"old"), "fallback | old");
}

TEST_F(MessageFilesTest, AFileIsOpenedAtItsFirstUseAndReadAtEachLookUp) {
  const MessageFiles files(kProgram, "", "en_US");
  Notices::Forget();
  EXPECT_EQ(files.ResolveLogMessage(4294967295U, "a \"b\""), "4294967295 \"a \"b\"\"");
  EXPECT_EQ(
      machine.Errors(),
      "panelglow-diags: The message file C:\\bench\\nonui_probe.msg is missing, so that numbers stand for texts: "
      "start the program in the folder of the installation.\n");
  Put("C:\\bench\\nonui_probe.msg", "[en_US]\n1=too late\n");
  Put("C:\\bench\\probe.msg", "[en_US]\n1=in time\n");
  EXPECT_EQ(files.ResolveLogMessage(1, "x"), "1 \"x\"");
  EXPECT_EQ(TextOf(files, 1), "in time");
  Put("C:\\bench\\probe.msg", "[en_US]\n1=edited\n");
  EXPECT_EQ(TextOf(files, 1), "edited");
  EXPECT_EQ(TextAndMedia(MessageFiles("C:\\suite\\other.exe", "", "en_US"), 1), "fallback | ");
  EXPECT_THAT(machine.Errors(), ::testing::HasSubstr("The message file C:\\bench\\other.msg is missing"));
}

TEST(MessageFiles, AFolderOfAnyDepthMayHoldThem) {
  EXPECT_EQ(InOwnProcess([] {
              std::string top = (std::filesystem::temp_directory_path() / "panelglow-deep-XXXXXX").string();
              std::filesystem::current_path(::mkdtemp(top.data()));
              for (int i = 0; i < 3; ++i) {
                const std::string folder(100, 'f');
                std::filesystem::create_directory(folder);
                std::filesystem::current_path(folder);
              }
              platform::sim::SimulationOptions options;
              options.realFiles = true;
              const Simulation machine(MachineDescription{}, options);
              platform::TheHost().files.Write(".\\probe.msg", "[en_US]\n1=deep\n");
              const std::string text = TextOf(MessageFiles("probe.exe", "", "en_US"), 1);
              std::filesystem::current_path("/");
              std::filesystem::remove_all(top);
              return text;
            }),
            "deep");
}

TEST(MessageFiles, TwoThreadsMayReachThemFirstAtTheSameTime) {
  EXPECT_EQ(InOwnProcess([] {
              const char* arguments[] = {kProgram};
              CmdLineParser::GetInstance(1, arguments);
              std::string texts;
              Simulation machine{MachineDescription{}, {}};
              machine.DiskFiles().Put("C:\\bench\\probe.msg", "[en_US]\n1=one %s\n");
              std::vector<platform::ThreadHandle> threads;
              for (int i = 0; i < 3; ++i) {
                threads.push_back(platform::TheHost().threads.Start(
                    "reader", [&texts] { texts += TextOf(MessageFiles::Instance(), 1) + ";"; }));
              }
              for (const platform::ThreadHandle thread : threads) {
                platform::TheHost().threads.Wait(thread, 10'000);
              }
              return texts;
            }),
            "one arg;one arg;one arg;");
}

}  // namespace
}  // namespace panelglow
