// Gives every fuzz target its examples and what once went wrong. A fault ends this program.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "FuzzTarget.h"

namespace panelglow::fuzz {

// Printed as it is, a target would put addresses of this build into the tests' names.
static void PrintTo(const Target& target, std::ostream* out) { *out << target.name; }

namespace {

namespace fs = std::filesystem;

std::string TextOf(const fs::path& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

class Replay : public testing::TestWithParam<Target> {};

TEST_P(Replay, EveryExampleIsReadWithoutFault) {
  const fs::path folder = fs::path(PANELGLOW_SOURCE_DIR) / "fuzz" / "corpus" / GetParam().name;
  ASSERT_TRUE(fs::is_directory(folder)) << folder;
  std::size_t examples = 0;
  for (const fs::directory_entry& example : fs::directory_iterator(folder)) {
    SCOPED_TRACE(example.path());
    GetParam().body(TextOf(example.path()));
    ++examples;
  }
  EXPECT_GT(examples, 0U);
  for (const std::string_view bytes : {std::string_view(), std::string_view("\0", 1), std::string_view("\xFF\n")}) {
    GetParam().body(bytes);
  }
}

INSTANTIATE_TEST_SUITE_P(Fuzz, Replay, testing::ValuesIn(Targets()),
                         [](const testing::TestParamInfo<Target>& target) { return target.param.name; });

}  // namespace
}  // namespace panelglow::fuzz
