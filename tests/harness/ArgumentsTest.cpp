// Parameters: how they are split, what a declared one accepts, how it explains itself, and whose value counts.
#include <gmock/gmock.h>

#include "harness/CDMArgument.h"
#include "harness/CmdLineParser.h"
#include "harness/Probe.h"
#include "harness/base/Notices.h"

namespace panelglow {
namespace {

using ::testing::ElementsAre;
using ::testing::Pair;
using ::testing::StartsWith;

using T = CDMConstraintType;
using Type = CDMArgumentType;

TEST(CmdLineParser, AParameterIsCutAtItsFirstEqualsSignAndTheLastOneOfAKeyCounts) {
  const char* arguments[] = {"C:\\suite\\Probe.EXE", "-A=b=C", "-Help", "-subtest=LEDTest", "-SUBTEST=Other", "-e="};
  const platform::sim::Simulation machine(platform::sim::MachineDescription{}, {});
  CmdLineParser parser(6, arguments);
  EXPECT_EQ(parser.GetProgramPath(), "C:\\suite\\Probe.EXE");
  EXPECT_THAT(parser.GetParameters(),
              ElementsAre(Pair("-a", "b=C"), Pair("-e", ""), Pair("-help", "-Help"), Pair("-subtest", "Other")));
  EXPECT_EQ(parser.GetParameter("-E", "default"), "");
  EXPECT_EQ(parser.GetParameter("-f", "default"), "default");
  parser.AddParameter("-F", "added");
  parser.AddParameter("-SubTest", "ignored");
  EXPECT_EQ(parser.GetParameter("-f", ""), "added");
  EXPECT_EQ(parser.GetParameter("-subtest", ""), "Other");
  EXPECT_EQ(CmdLineParser(0, nullptr).GetProgramPath(), "");
}

TEST(CDMConstraint, AValuePassesByTypeAndRule) {
  constexpr std::int64_t kBig = 5'000'000'000;
  struct Case {
    CDMConstraint rule;
    std::vector<const char*> passing;
    std::vector<const char*> failing;
  };
  const Case kCases[] = {
      {CDMConstraint(0, 10), {"0", "10", "0x0A", "-0"}, {"11", "-1", "abc", "", "1.0", " 1", "99999999999"}},
      {CDMConstraint(0.5, 1.5), {"0.5", "1.5", "+1", ".75"}, {"1.51", "0.49", "1.", "-0.5", "0x1", "1e0"}},
      {CDMConstraint(kBig, kBig + 1), {"5000000000", "0x12A05F201"}, {"4999999999", "5000000002", "-5000000000", ""}},
      {CDMConstraint(5, T::Equal), {"5", "0x5"}, {"6", "x"}},
      {CDMConstraint(5, T::DifferentThan), {"4", "-5"}, {"5", "x"}},
      {CDMConstraint(5, T::GreaterThan), {"6"}, {"5"}},
      {CDMConstraint(5, T::EqualToOrGreaterThan), {"5", "6"}, {"4"}},
      {CDMConstraint(5, T::EqualToOrLessThan), {"5", "-6"}, {"6"}},
      {CDMConstraint(5, T::LessThan), {"4"}, {"5"}},
      {CDMConstraint(kBig, T::LessThan), {"4999999999", "-9000000000000000000"}, {"5000000000"}},
      {CDMConstraint(5, static_cast<T>(6)), {}, {"4", "5", "6"}},
      {CDMConstraint("Default,,Fast"), {"FAST", "default"}, {"fastest", "", "Default,,Fast", " fast"}},
      {CDMConstraint(""), {}, {"", "a"}},
      {CDMConstraint(","), {}, {"", ","}},
  };
  for (const Case& c : kCases) {
    SCOPED_TRACE(c.rule.GetHelp());
    for (const char* value : c.passing) {
      EXPECT_TRUE(c.rule.Check(value)) << value;
    }
    for (const char* value : c.failing) {
      EXPECT_FALSE(c.rule.Check(value)) << value;
    }
  }
}

TEST(CDMArgument, CatalogueAndDictionaryShowADeclarationOnOneLineEachInTheirOwnSpelling) {
  const CDMArgument full("-Mode", Type::String, "a\"b", "Say \"A\" &\r\n`go`\nnow", true,
                         std::make_unique<CDMConstraint>("A<B,,c"), true, true);
  EXPECT_EQ(full.GetCatalogEntry(3),
            "   <ARGUMENT Name=\"-Mode\" Type=\"string\" Value=\"a\"b\" List=\"A&lt;B,,c\" Required=\"true\" "
            "Description=\"Say &quot;A&quot; &amp; &apos;go&apos; now\" Hidden=\"true\" GUIHidden=\"true\" />");
  EXPECT_EQ(full.GetDictionaryEntry("T"),
            "\nT/-Mode/Name = TBC\nT/-Mode/Description = Say \"A\" & `go` now\n"
            "T/-Mode/List/A<B = TBC\nT/-Mode/List/c = TBC\n");
  const CDMArgument number("-Mode", Type::Integer, "", "", false, std::make_unique<CDMConstraint>("A"), false, false);
  EXPECT_EQ(number.GetDictionaryEntry("T"), "\nT/-Mode/Name = TBC\nT/-Mode/Description = \n");
  EXPECT_THAT(full.GetHelp(), ::testing::EndsWith("|c]\n\t * Default value: a\"b\n\t * Required: true"));
  const CDMArgument bare("", Type::LargeInteger, "", "", false, nullptr, false, false);
  EXPECT_EQ(bare.GetCatalogEntry(0), "<ARGUMENT Type=\"largeinteger\" Required=\"false\" />");
}

TEST(CDMConstraint, ARuleIsWordsInTheHelpAndAttributesInTheCatalogue) {
  const std::tuple<CDMConstraint, const char*, const char*> kCases[] = {
      {CDMConstraint(0.25, 1000000.0), "between [0.25..1e+06]", " Low=\"0.25\" High=\"1e+06\""},
      {CDMConstraint(std::int64_t{-1}, std::int64_t{5'000'000'000}), "between [-1..5000000000]",
       " Low=\"-1\" High=\"5000000000\""},
      {CDMConstraint("A,b"), "one of [A|b]", " List=\"A,b\""},
      {CDMConstraint(0.5, T::Equal), "equal to 0.5", " Equal=\"0.5\""},
      {CDMConstraint(0.5, T::DifferentThan), "different than 0.5", " DifferentThan=\"0.5\""},
      {CDMConstraint(1, T::GreaterThan), "greater than 1", " GreaterThan=\"1\""},
      {CDMConstraint(5, T::EqualToOrGreaterThan), "equal to or greater than 5", " EqualToOrGreaterThan=\"5\""},
      {CDMConstraint(1, T::EqualToOrLessThan), "equal to or less than 1", " EqualToOrLessThan=\"1\""},
      {CDMConstraint(std::int64_t{7}, T::LessThan), "less than 7", " LessThan=\"7\""},
  };
  for (const auto& [rule, words, attributes] : kCases) {
    EXPECT_EQ(rule.GetHelp(), std::string("\n\t - Value must be ") + words);
    EXPECT_EQ(rule.GetCatalogAttributes(), attributes);
  }
  EXPECT_EQ(CDMConstraint("").GetHelp(), "\n\t - Value must be equal to ");
  const CDMConstraint unknown(5, static_cast<T>(6));
  EXPECT_EQ(unknown.GetHelp() + unknown.GetCatalogAttributes(), "");
}

TEST(CDMDiag, AValueComesFromTheCommandLineThenTheDeclarationThenTheCaller) {
  ProbeRun run{"-subtest=Probe -mode=fast -ratio= -serial=0x1F"};
  run.prepare = [](Probe& probe) {
    CDMDiag::LogMessage(LogOptions::Other, 1,
                        CDMUtil::ToString(probe.GetArgument("-Level", 5)) + " " +
                            probe.GetArgument("-MODE", "caller") + " " + probe.GetArgument("-Ratio", "caller") + " " +
                            CDMUtil::ToString(probe.GetArgument("-Loud", false)) + " " +
                            CDMUtil::ToString(probe.GetArgument("-loud", true)) + " " +
                            CDMUtil::ToString(probe.GetArgument("-Serial", 5)) + " " +
                            CDMUtil::ToString(probe.GetArgument("-Mode", 5)));
    const std::string help = probe.GetArgumentsHelp();
    CDMDiag::LogMessage(LogOptions::Other, 2,
                        help.find("-Mode=") < help.size() && help.find("-Serial") > help.size());
  };
  EXPECT_THAT(run.Lines(), StartsWith("LogMessage 1 1 \"30 fast caller true true 31 0\" \"\"\n"
                                      "LogMessage 1 2 \"true\" \"\"\n"));  // a hidden one is not explained
}

TEST(CDMDiag, ANumberThatIsNoneOrDoesNotFitIsToldWithWhatItCountsAs) {
  for (const auto& [text, counts] :
       std::initializer_list<std::pair<const char*, const char*>>{{"2147483647", nullptr},
                                                                  {"-0x80000000", nullptr},
                                                                  {"7FFF", "0"},
                                                                  {"OxF9", "0"},
                                                                  {"-", "0"},
                                                                  {"2147483648", "2147483647"},
                                                                  {"0xFFFFFFFF", "2147483647"},
                                                                  {"0xFFFFFFFFFFFFFFFFF", "2147483647"}}) {
    ProbeRun run{"-subtest=Probe -mode=" + std::string(text)};
    run.prepare = [](Probe& probe) {
      Notices::Forget();
      probe.Declare("-Mode", CDMArgumentType::String, "");
      static_cast<void>(probe.GetArgument("-Mode", 5));
    };
    EXPECT_EQ(run.Errors(),
              counts == nullptr
                  ? std::string()
                  : "panelglow-diags: The parameter -Mode is \"" + std::string(text) +
                        "\", which is no number of 32 bits, decimal or hexadecimal behind 0x: it counts "
                        "as " +
                        counts + ".\n");
  }
}

TEST(CDMDiag, TheConfigurationFileOfThePromptsIsTheOneThatIsNamed) {
  for (const auto& [words, found] : {std::pair{"", "none"}, {"-diagconf=.\\Look.ini", "255"}}) {
    ProbeRun run{"-subtest=Probe " + std::string(words)};
    run.files[".\\Look.ini"] = "[WindowSettings]\nBackgroundColor=255\n";
    run.body = [] {
      const platform::Color ground = CDMDiag::GetWindowBackgroundBrush();
      CDMDiag::ReportFailure(CDMDiag::HasWindowSettings() ? CDMUtil::ToString(ground) : "none");
      return true;
    };
    EXPECT_EQ(run.Lines(), "ReportFailure " + std::string(found) + "\nEndOfTest\n= 0\n");
  }
}

TEST(CDMDiag, ControlFilesCountByPlaceAndWholeContentAlsoWithoutProgramData) {
  const std::tuple<const char*, const char*, const char*> kCases[] = {
      {"\\halcyon.ctl", "pause", "pause"}, {"\\halcyon.ctl", "resume", "resume"},
      {"\\halcyon.ctl", "resume\r\n", ""}, {"\\halcyon.ctl", "terminate", "stop"},
      {".\\halcyon.ctl", "terminate", ""}, {"\\Tamberlane\\TMB Halcyon Hardware Diagnostics\\kill.ctl", "", ""},
      {"\\kill.ctl", "", "stop"},          {".\\kill.ctl", "", "stop"}};
  for (const auto& [path, content, asked] : kCases) {
    for (const bool isSet : {false, true}) {
      platform::sim::MachineDescription description;
      description.environment.clear();
      if (isSet) {
        description.environment["ProgramData"] = "";
      }
      platform::sim::Simulation machine(std::move(description), {});
      machine.DiskFiles().Put(path, content);
      EXPECT_EQ(std::string(CDMDiag::ShouldTestBeTerminated() ? "stop" : "") +
                    (CDMDiag::IsPauseRequested() ? "pause" : "") + (CDMDiag::IsResumeRequested() ? "resume" : ""),
                asked)
          << path << content;
    }
  }
}

}  // namespace
}  // namespace panelglow
