// What the product says about itself, byte by byte: other tools read these texts.
#include <gmock/gmock.h>

#include <filesystem>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::EndsWith;
using ::testing::StartsWith;

// The program's path stands in the texts as it was called.
std::string Expected(const std::string& name) {
  const std::string program = (std::filesystem::path(PANELGLOW_BINARY_DIR) / "panelglow-diags").string();
  std::string text = Golden("information/" + name + ".golden");
  constexpr std::string_view kPlaceholder = "@PROGRAM@";
  for (std::size_t at = text.find(kPlaceholder); at != std::string::npos; at = text.find(kPlaceholder, at)) {
    text.replace(at, kPlaceholder.size(), program);
  }
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
