// The structured log: what a run's attempts come to, and what stands in the file.
#include "harness/DataCollectionLog.h"

#include <gmock/gmock.h>

#include <cstdlib>
#include <filesystem>
#include <utility>

#include "harness/CmdLineParser.h"
#include "harness/OwnProcess.h"
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow::CDMUtil {
namespace {

namespace fs = std::filesystem;

using platform::sim::MachineDescription;
using platform::sim::Simulation;

TEST(DataCollectionLog, AttemptsAreCountedAndTheirCodesCollected) {
  struct Case {
    std::vector<std::pair<int, const char*>> calls;  // number, code
    const char* attempts;                            // number:codes
    const char* code;                                // of the subtest
    const char* retries;
  };
  const Case kCases[] = {
      {{{0, "990100"}, {1, "995000"}}, "0:990100 1:995000 ", "995000", "1"},
      {{{0, "1"}, {0, "2"}, {0, "3"}}, "0:1,2,3 ", "1", "0"},
      {{{0, "1"}, {0, ""}}, "0:1, ", "1", "0"},
      {{{0, ""}, {0, "2"}}, "0:2 ", "", "0"},
      {{{2, "1"}, {1, "2"}}, "2:1 1:2 ", "2", "2"},
      {{{9, "1"}, {10, "2"}}, "9:1 10:2 ", "2", "10"},
      // A number that was there before is taken up again, and takes the last one's place.
      {{{0, "1"}, {1, "2"}, {0, "3"}}, "0:1 0:1,3 ", "2", "1"},
  };
  for (const Case& c : kCases) {
    Simulation machine(MachineDescription{}, {});
    SubtestDetails details;
    SubtestAttempt current;
    const std::uint32_t begin = platform::TheHost().clock.TickCount();
    for (const auto& [number, code] : c.calls) {
      platform::TheHost().clock.Sleep(20'000);  // past the counter's end
      PopulateAttemptInformation(number, code, details, current, begin);
    }
    std::string attempts;
    for (const SubtestAttempt& attempt : details.attempts) {
      attempts += attempt.number + ":" + attempt.errorcode + " ";
    }
    EXPECT_EQ(attempts, c.attempts);
    EXPECT_EQ(details.errorcode, c.code) << attempts;
    EXPECT_EQ(details.retriesattempted, c.retries) << attempts;
    EXPECT_EQ(current.duration, std::to_string(20'000 * c.calls.size())) << attempts;
  }
}

// What a run with one measured value leaves in "log.xml" and on the output, with `before` in the file. Files are real
// ones: the strict check reads them by itself.
std::string LogOf(const std::string& path, const std::string& before) {
  return InOwnProcess([&] {
    const char* arguments[] = {"probe", "-Note=<\"&'>", "-empty="};
    CmdLineParser::GetInstance(3, arguments);
    std::string folder = (fs::temp_directory_path() / "panelglow-log-XXXXXX").string();
    fs::current_path(::mkdtemp(folder.data()));
    platform::sim::SimulationOptions options;
    options.realFiles = true;
    const Simulation machine(MachineDescription{}, options);
    if (!before.empty()) {
      platform::TheHost().files.Write("log.xml", before);
    }
    SubtestDetails details;
    details.attempts = {{"0", "990100", "5", {{"a < b", "failed", "1", "2", "3", "4", "now"}}}};
    const bool corrupted = isXMLCorrupted(path);
    const std::uint32_t begin = platform::TheHost().clock.TickCount();
    platform::TheHost().clock.Sleep(61'999);
    PopulateSubtestInfoAndWriteLog(path, "probe", details, begin, corrupted);
    const std::string after = platform::TheHost().files.Read("log.xml").value_or("no file\n");
    fs::remove_all(folder);
    return after + machine.Output();
  });
}

TEST(DataCollectionLog, ARunIsAddedWithItsTimesResultsAndParameters) {
  const std::string log = LogOf(" log.xml\t", "<DiagnosticsData Version=\"4.0\"><Older/></DiagnosticsData>");
  for (const char* part :
       {"<DiagnosticsData Version=\"4.0\">\n  <Older/>\n  <Diagnostic name=\"probe\">\n    <Subtest name=\"\"",
        " duration=\"61999\"", " starttime=\"03/01/2024 14:11:59\" endtime=\"03/01/2024 14:13:00\">",
        "errorcode=\"990100\">\n          <Results>\n            <Result description=\"a &lt; b\" status=\"failed\""
        " actualmin=\"1\" actualmax=\"2\" expectedmin=\"3\" expectedmax=\"4\" timestamp=\"now\"/>\n",
        "<Argument name=\"-empty\" value=\"\"/>\n        <Argument name=\"-note\" value=\"&lt;&quot;&amp;'&gt;\"/>\n",
        "LogMessage 14 8 \"DataCollection XML log written successfully\" \"\"\n"}) {
    EXPECT_THAT(log, ::testing::HasSubstr(part));
  }
  EXPECT_THAT(LogOf("log.xml", "<DiagnosticsData><Older/></DiagnosticsData>"),
              ::testing::HasSubstr("<DiagnosticsData Version=\"4.15.0\">\n  <Older/>\n"));
}

TEST(DataCollectionLog, ADamagedFileStaysAsItIsAlsoWithBlanksAroundItsPath) {
  EXPECT_EQ(
      LogOf(" log.xml ", "<a><b></a>"),
      "<a><b></a>LogMessage 14 8 \"XML file is corrupted! The subtest will continue without writing data to the "
      "XML file.\" \"\"\n");
  EXPECT_EQ(LogOf("", ""), "no file\n");
}

}  // namespace
}  // namespace panelglow::CDMUtil
