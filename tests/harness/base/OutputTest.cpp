// The line protocol, the exceptions that are reported through it, and the formatter of message texts.
#include <gtest/gtest.h>

#include <cstring>
#include <sstream>
#include <string>
#include <vector>

#include "harness/base/CDMException.h"
#include "harness/base/CDMout.h"
#include "harness/base/MessageFormat.h"
#include "harness/base/Notices.h"
#include "platform/sim/Simulation.h"

namespace panelglow {
namespace {

using platform::sim::MachineDescription;
using platform::sim::Simulation;

class Output : public testing::Test {
 protected:
  void TearDown() override {
    CDMout::SetDebugQuery({});
    CDMout::SetMessageResolver({});
  }

  // What the program has written since the last call.
  std::string Lines() {
    std::string lines = machine_.Output();
    machine_.ClearOutput();
    return lines;
  }

  Simulation machine_{MachineDescription{}, {}};
};

TEST_F(Output, LimitsThePercentageAndReportsVerdicts) {
  CDMout::UpdatePercentage(-1);
  CDMout::UpdatePercentage(42);
  CDMout::UpdatePercentage(150);
  CDMout::TestFailed(1234567, "why\nnot");
  CDMout::TestFailed("why\r\nnot");
  CDMout::ReportFailure("a\rb");
  EXPECT_EQ(Lines(),
            "UpdatePercentage 0\nUpdatePercentage 42\nUpdatePercentage 100\nTestFailed 1234567 \"why not\"\n"
            "TestFailed why not\nReportFailure a b\n");
}

TEST_F(Output, LogsOnOneLineWithoutEscaping) {
  CDMout::LogMessage(LogOptions::Status, kFreeText, "one\r\ntwo\nthree\r\r\n\"four\"");
  CDMout::LogMessage(LogOptions::Unknown, 4294967295U, static_cast<const char*>(nullptr));
  CDMout::LogMessage(LogOptions::Debug, 1, -5);
  CDMout::LogMessage(LogOptions::Debug, 1, false);
  EXPECT_EQ(Lines(),
            "LogMessage 6 20000 \"one two three  \"four\"\" \"\"\nLogMessage 0 4294967295 \"\" \"\"\n"
            "LogMessage 14 1 \"-5\" \"\"\nLogMessage 14 1 \"false\" \"\"\n");
}

TEST_F(Output, TellsPeopleASentenceOnceAndTheControllerNothing) {
  Notices::Forget();
  Notices::Tell("The key \"a\nb\" has no value.");
  Notices::Tell("Another.");
  Notices::Tell("The key \"a\nb\" has no value.");
  EXPECT_EQ(machine_.Errors(), "panelglow-diags: The key \"a b\" has no value.\npanelglow-diags: Another.\n");
  EXPECT_EQ(Lines(), "");
}

TEST_F(Output, NamesTheClassAndResolvesTheTextInDebugMode) {
  bool debug = true;
  CDMout::SetDebugQuery([&] { return debug; });
  CDMout::LogMessage(LogOptions::DeviceErrors, 23, "x\ny");
  CDMout::LogMessage(LogOptions::Invalid, 23, "");
  CDMout::LogMessage(LogOptions::Unknown, 23, "");
  CDMout::LogMessage(static_cast<LogOptions>(16), 23, "");
  EXPECT_EQ(Lines(),
            "LogMessage DeviceErrors 23 \"x y\" \"\"\nLogMessage Invalid 23 \"\" \"\"\n"
            "LogMessage 0 23 \"\" \"\"\nLogMessage 16 23 \"\" \"\"\n");
  CDMout::SetMessageResolver([](unsigned int id, const std::string& text) { return std::to_string(id * 2) + text; });
  CDMout::LogMessage(LogOptions::Status, 23, "!");
  debug = false;  // asked at each line
  CDMout::LogMessage(LogOptions::Status, 23, "!");
  EXPECT_EQ(Lines(), "LogMessage Status 46! \"\"\nLogMessage 6 23 \"!\" \"\"\n");
}

TEST_F(Output, KeepsTheLinesOfThreadsWhole) {
  platform::Threads& threads = machine_.TheMachine().threads;
  std::vector<platform::ThreadHandle> started;
  for (const char* text : {"aaaa", "bbbb", "cccc"}) {
    started.push_back(threads.Start(text, [text] {
      for (int i = 0; i < 50; ++i) {
        CDMout::LogMessage(LogOptions::Status, kFreeText, text);
      }
    }));
  }
  for (const platform::ThreadHandle thread : started) {
    ASSERT_TRUE(threads.Wait(thread, platform::Threads::kNoLimit));
  }
  std::istringstream lines(Lines());
  int count = 0;
  for (std::string line; std::getline(lines, line); ++count) {
    EXPECT_EQ(line.size(), std::string("LogMessage 6 20000 \"aaaa\" \"\"").size()) << line;
  }
  EXPECT_EQ(count, 150);
}

// ---- CDMException

TEST_F(Output, NamesTheManagementCallThatFailed) {
  InvalidTmbWMICallException(3, 4294967295U).Report();
  EXPECT_EQ(Lines(), "LogMessage 8 995174 \"tmbWMI call (3,4294967295) failed.\" \"\"\nTestFailed 995174 \"\"\n");
}

// ---- message formats

TEST(MessageFormat, FillsInTheFirstStringAndNothingElse) {
  const std::pair<const char*, const char*> kCases[] = {
      {"press %s now", "press key now"},
      {"%S", "key"},
      {"%ls%hs%ws", "key"},
      {"%s%s%s", "key"},
      {"100%% of %s", "100% of key"},
      {"%5s|", "  key|"},
      {"%-5s|", "key  |"},
      {"%05s|", "00key|"},
      {"%.2s|", "ke|"},
      {"%-6.1s|", "k     |"},
      {"%.s|", "|"},
      {"%d%i%u%x%X%c%C%p|%s", "|key"},
      {"%99999d|", "|"},
      {"%n%f%e%g%o%*s", "nfego*s"},
      {"%", "%"},
      {"a%-08.3", "a%-08.3"},
      {"", ""},
      {"none", "none"},
  };
  for (const auto& [format, text] : kCases) {
    EXPECT_EQ(FormatMessageText(format, "key"), text) << format;
    const wstring wideFormat(format, format + std::strlen(format));
    EXPECT_TRUE(FormatMessageText(wideFormat, u"key") == wstring(text, text + std::strlen(text))) << format;
  }
  EXPECT_EQ(FormatMessageText("<%s>", "%s%n"), "<%s%n>");
}

TEST(MessageFormat, EndsAt1023Characters) {
  const std::string longest(kLongestMessage, 'x');
  EXPECT_EQ(FormatMessageText(longest + "y", ""), longest);
  EXPECT_EQ(FormatMessageText("%s", longest + "y"), longest);
  EXPECT_EQ(FormatMessageText("%99999999999999999999s", "x"), std::string(kLongestMessage - 1, ' ') + "x");
  EXPECT_EQ(FormatMessageText("%.99999999999999999999s", "key"), "key");
  EXPECT_EQ(FormatMessageText("%-9999s|", "x").size(), kLongestMessage);
}

}  // namespace
}  // namespace panelglow
