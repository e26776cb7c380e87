// What the product says about itself, byte by byte: other tools read these texts.
#include <gmock/gmock.h>

#include <filesystem>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::EndsWith;
using ::testing::StartsWith;

void ReplaceAll(std::string& text, const std::string& from, const std::string& to) {
  for (std::size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size())) {
    text.replace(at, from.size(), to);
  }
}

// The lines from the one that begins with `first` to the one that begins with `behind`.
std::string Between(const std::string& text, const std::string& first, const std::string& behind) {
  const std::size_t begin = text.find("\n" + first) + 1;
  return text.substr(begin, text.find("\n" + behind, begin) - begin);
}

// The program's path stands in the texts as it was called; and in that of the whole program the catalogue, two blanks
// further in, and the dictionary of each subtest, as that subtest alone has them. The options that every usage has
// stand in that of the whole program.
std::string Expected(const std::string& name) {
  std::string text = Golden("information/" + name + ".golden");
  for (const std::string subtest : {"CustomLEDTest", "LEDStatusIndicator", "LEDTest"}) {
    const std::string own = Golden("information/" + subtest + ".golden");
    std::string catalogue = "\n" + Between(own, "    <ARGUMENT", "</TEST>");
    ReplaceAll(catalogue, "\n", "\n  ");
    ReplaceAll(text, "\n@CATALOG " + subtest + "@", catalogue);
    ReplaceAll(text, "@DICTIONARY " + subtest + "@", Between(own, subtest + "/Name", "\nTMB CDM"));
  }
  ReplaceAll(text, "@OPTIONS@", Between(Golden("information/diagnostic.golden"), "-version=", "\n"));
  ReplaceAll(text, "@PROGRAM@", (std::filesystem::path(PANELGLOW_BINARY_DIR) / "panelglow-diags").string());
  return text;
}

Outcome Ask(const std::vector<std::string>& arguments) {
  const Installation installation;
  return RunProgram("panelglow-diags", arguments, installation.Path(""), {});
}

const std::vector<std::string> kRequests = {"-version=true", "-catalog=true", "-dictionary=True", "-description=true",
                                            "-help=TRUE"};

TEST(SystemInformation, EachRequestIsAnsweredAloneAndAllInOneStartInTheirOrder) {
  for (const std::string about : {"diagnostic", "CustomLEDTest", "LEDStatusIndicator", "LEDTest"}) {
    SCOPED_TRACE(about);
    const std::string subtest = about == "diagnostic" ? "-subtest=" : "-subtest=" + about;
    std::vector<std::string> all{"-help=true", subtest};
    std::string oneByOne;
    for (const std::string& request : kRequests) {
      const Outcome outcome = Ask({subtest, request});
      EXPECT_EQ(outcome.exitCode, 0);
      oneByOne += outcome.output;
      all.push_back(request);
    }
    const Outcome together = Ask(all);
    EXPECT_EQ(together.exitCode, 0);
    EXPECT_EQ(together.output, Expected(about));
    EXPECT_EQ(oneByOne, Expected(about));
    EXPECT_EQ(together.errors, "");
  }
}

TEST(SystemInformation, AnUnknownSubtestGetsTheUsageWithAllNames) {
  const Outcome outcome = Ask({"-subtest=ledtest", "-help=true", "-nonsense"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(Expected("diagnostic"), EndsWith(outcome.output));
  EXPECT_THAT(outcome.output, StartsWith("Usage:\n"));
}

TEST(SystemInformation, AValueThatIsNeitherTrueNorFalseIsNamedAndNothingRuns) {
  for (const std::string help : {"-help=yes", "-help"}) {
    const Outcome outcome = Ask({help, "-catalog=x", "-subtest=LEDTest", "-version=true"});
    EXPECT_EQ(outcome.exitCode, 1);
    EXPECT_EQ(outcome.output, Expected("refused"));
  }
}

}  // namespace
}  // namespace panelglow::systemtest
