// The structured log: what a run's attempts come to, and what stands in the file.
#include "harness/DataCollectionLog.h"

#include <gmock/gmock.h>

#include <functional>
#include <utility>

#include "harness/CmdLineParser.h"
#include "harness/OwnProcess.h"
#include "platform/Host.h"
#include "platform/sim/Simulation.h"

namespace panelglow::CDMUtil {
namespace {

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

struct LogRun {
  std::string path = "log.xml";
  std::string before{};                     // in "log.xml"; empty for no file
  const char* note = "-Note=<\"&'>";        // a parameter
  bool isLong = false;                      // `before` is followed by more than 64 MiB of blanks
  std::function<void()> meanwhile = [] {};  // happens during the run

  /// What a run with one measured value leaves in "log.xml", on the output and on standard error.
  [[nodiscard]] std::string Leaves() const {
    return InOwnProcess([this] {
      const char* arguments[] = {"probe", note, "-empty="};
      CmdLineParser::GetInstance(3, arguments);
      Simulation machine(MachineDescription{}, {});
      if (!before.empty()) {
        machine.DiskFiles().Put("log.xml", before + std::string(isLong ? std::size_t{65} << 20U : 0, ' '));
      }
      SubtestDetails details;
      details.retriesspecified = "7";
      details.retriesattempted = "3";
      details.attempts = {{"0", "990100", "5", {{"a < b", "failed", "1", "2", "3", "4", "now"}}}};
      const bool corrupted = isXMLCorrupted(path);
      const std::uint32_t begin = platform::TheHost().clock.TickCount();
      platform::TheHost().clock.Sleep(61'999);
      meanwhile();
      PopulateSubtestInfoAndWriteLog(path, "probe", details, begin, corrupted);
      return platform::TheHost().files.Read("log.xml").value_or("no file\n").substr(0, 9999) + machine.Output() +
             machine.Errors();
    });
  }
};

std::string LogOf(const std::string& path, const std::string& before) { return LogRun{path, before}.Leaves(); }

TEST(DataCollectionLog, ARunIsAddedWithItsTimesResultsAndParameters) {
  const std::string log = LogOf(" log.xml\t", "<DiagnosticsData Version=\"4.0\"><Older/></DiagnosticsData>");
  for (const char* part :
       {"<DiagnosticsData Version=\"4.0\">\n  <Older/>\n  <Diagnostic name=\"probe\">\n    <Subtest name=\"\"",
        " duration=\"61999\"", " starttime=\"03/01/2024 14:11:59\" endtime=\"03/01/2024 14:13:00\">",
        "<Attempts retriesspecified=\"7\" retriesattempted=\"3\">",
        "errorcode=\"990100\">\n          <Results>\n            <Result description=\"a &lt; b\" status=\"failed\""
        " actualmin=\"1\" actualmax=\"2\" expectedmin=\"3\" expectedmax=\"4\" timestamp=\"now\"/>\n",
        "<Argument name=\"-empty\" value=\"\"/>\n        <Argument name=\"-note\" value=\"&lt;&quot;&amp;'&gt;\"/>\n",
        "LogMessage 14 8 \"DataCollection XML log written successfully\" \"\"\n"}) {
    EXPECT_THAT(log, ::testing::HasSubstr(part));
  }
  EXPECT_THAT(LogOf("log.xml", "<DiagnosticsData><Older/></DiagnosticsData>"),
              ::testing::HasSubstr("<DiagnosticsData Version=\"4.15.0\">\n  <Older/>\n"));
}

TEST(DataCollectionLog, WhateverTheStrictCheckTakesIsAddedToAndKept) {
  const std::pair<std::string, const char*> kCases[] = {
      {"\xEF\xBB\xBF<?xml version='1.0' encoding='utf-8'?><D Version='4'><O>\xC3\xA4</O></D>",
       "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<D Version=\"4\">\n  <O>\xC3\xA4</O>\n  <Diagnostic "},
      {"<?xml version='1.0' encoding='ISO-8859-1' standalone='yes'?><D Version='4'>\xE4</D>",
       "<?xml version=\"1.0\" encoding=\"UTF-8\" standalone=\"yes\"?>\n<D Version=\"4\">\xC3\xA4  <Diagnostic "},
      {std::string("\xFF\xFE<\0D\0>\0<\0O\0/\0>\0<\0/\0D\0>\0", 24),
       "<D Version=\"4.15.0\">\n  <O/>\n  <Diagnostic "},
      {"<D><O>a<![CDATA[<b>&]]>c</O></D>", "<O>a&lt;b&gt;&amp;c</O>\n"},
      {"<D><O a='1>2/>' b='x&#9;&#x41;'/></D>", "<O a=\"1&gt;2/&gt;\" b=\"x&#09;A\"/>\n"},
      {"<!-- head --><?p?><D><!--in--><O>a<!-- b -->c</O><!----></D><!--end-->",
       "<!-- head -->\n<?p?>\n<!--end-->\n<!---->\n<D Version=\"4.15.0\">\n  <!--in-->\n  <!-- b -->\n  <O>ac</O>\n"},
      {"<D xmlns='u' xmlns:p='v'><p:O p:a='1'/></D>",
       "<D xmlns=\"u\" xmlns:p=\"v\" Version=\"4.15.0\">\n  <p:O p:a=\"1\"/>\n"},
  };
  for (const auto& [before, kept] : kCases) {
    const std::string log = LogOf("log.xml", before);
    EXPECT_THAT(log, ::testing::HasSubstr(kept));
    EXPECT_THAT(log, ::testing::EndsWith("written successfully\" \"\"\n"));
  }
  EXPECT_THAT((LogRun{.before = "<D><O/></D>", .isLong = true}.Leaves()),
              ::testing::StartsWith("<D Version=\"4.15.0\">\n  <O/>\n  <Diagnostic "));
}

TEST(DataCollectionLog, AFileThatCannotBeAddedToWithoutALossStaysAsItIsAndPeopleAreToldWhy) {
  std::string deep = "<a>";
  for (int i = 0; i < 300; ++i) {
    deep = "<a>" + deep + "</a>";
  }
  const std::pair<std::string, const char*> kCases[] = {
      {deep + "</a>", "elements are nested deeper than 256 levels"},
      {"<a><b></a>", "Opening and ending tag mismatch"},
      {"<a>\n<b/>text</a>", "line 2: text stands behind an element."},
      {"<a><b c='1' C='2'/></a>", "line 1: two attributes differ in the case of their names only (C)."},
      {"<a><_b/></a>", "Invalid tag name"},
      {"<a><!--?>--></a>", "line 1: a comment holds \"?>\"."},
      {"<a--></a-->", "the name a-- cannot be told from a comment's end."},
      {"<!DOCTYPE a><a/>", "a document type declaration (a) is not allowed here."},
  };
  for (const auto& [before, reason] : kCases) {
    const std::string log = LogOf(" log.xml ", before);
    EXPECT_THAT(log, ::testing::StartsWith(
                         before + "LogMessage 14 8 \"XML file is corrupted! The subtest will continue "
                                  "without writing data to the XML file.\" \"\"\npanelglow-diags: The "
                                  "structured log log.xml is left as it is, without a record of this run: "));
    EXPECT_THAT(log, ::testing::HasSubstr(reason));
  }
  EXPECT_EQ(LogOf("", ""), "no file\n");
}

TEST(DataCollectionLog, AFileThatGoesBadDuringTheRunIsNotReplaced) {
  LogRun run;
  run.meanwhile = [] { platform::TheHost().files.Write("log.xml", "<a>half"); };
  const std::string log = run.Leaves();
  EXPECT_THAT(log, ::testing::StartsWith("<a>halfLogMessage 14 8 \"DataCollection XML log could not be written"));
  EXPECT_THAT(log, ::testing::HasSubstr("log.xml is left as it is"));
}

TEST(DataCollectionLog, NoParameterSpoilsTheFile) {
  for (const auto& [note, written] : {std::pair{"-note=caf\xE9 \x80", "caf\xC3\xA9 \xE2\x82\xAC"},
                                      {"-note=\xEF\xBF\xBF.\xED\xA0\x80", "\xC3\xAF\xC2\xBF"},
                                      {"-note=\xEF\xBF\xBF.", "\xEF\xBF\xBD."},
                                      {"-note=\xC3\xA9", "\xC3\xA9"}}) {
    LogRun run;
    run.note = note;
    const std::string log = run.Leaves();
    EXPECT_THAT(log, ::testing::HasSubstr("<Argument name=\"-note\" value=\"" + std::string(written)));
    run.before = log.substr(0, log.find("LogMessage"));
    EXPECT_THAT(run.Leaves(), ::testing::EndsWith("written successfully\" \"\"\n"));
  }
}

}  // namespace
}  // namespace panelglow::CDMUtil
