// The page of the keys, held against the keys that the code reads.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>

#include "boardtool/Installation.h"
#include "boardtool/KnownKeys.h"
#include "platform/sim/Simulation.h"

namespace panelglow::boardtool {
namespace {

// The keys that a form stands for: "a.{b,c}" is "a.b" and "a.c".
std::vector<std::string> KeysOf(const std::string& form) {
  const std::size_t open = form.find('{');
  if (open == std::string::npos) {
    return {form};
  }
  const std::size_t close = form.find('}', open);
  std::vector<std::string> keys;
  std::istringstream choices(form.substr(open + 1, close - open - 1));
  for (std::string choice; std::getline(choices, choice, ',');) {
    for (const std::string& key : KeysOf(form.substr(0, open) + choice + form.substr(close + 1))) {
      keys.push_back(key);
    }
  }
  return keys;
}

std::string Numbered(std::string key) {
  for (std::size_t at = key.find("<n>"); at != std::string::npos; at = key.find("<n>")) {
    key.replace(at, 3, "1");
  }
  return LoweredName(key);
}

struct PageKeys {
  std::set<std::string> board;
  std::set<std::string> chip;
};

// Of the tables with a column "where": what stands between back quotes in the first column.
PageKeys KeysOfThePage() {
  std::ifstream page(std::filesystem::path(PANELGLOW_SOURCE_DIR) / "docs" / "writing-a-platform.md");
  PageKeys keys;
  bool isTable = false;
  for (std::string line; std::getline(page, line);) {
    isTable = line.starts_with("| key | where |") || (isTable && line.starts_with("|"));
    const std::size_t second = line.find('|', 1);
    if (!isTable || second == std::string::npos) {
      continue;
    }
    std::set<std::string>& where = line.substr(second).starts_with("| chip |") ? keys.chip : keys.board;
    const std::string cell = line.substr(0, second);
    for (std::size_t open = cell.find('`'); open != std::string::npos; open = cell.find('`', open)) {
      const std::size_t close = cell.find('`', open + 1);
      for (const std::string& key : KeysOf(cell.substr(open + 1, close - open - 1))) {
        where.insert(Numbered(key));
      }
      open = close + 1;
    }
  }
  return keys;
}

TEST(KnownKeys, StandAllOnThePageAndTheirsAreAllRead) {
  platform::sim::Simulation machine("");
  const KnownKeys known(platform::TheHost());
  const PageKeys page = KeysOfThePage();
  for (const bool isChipFile : {false, true}) {
    const std::set<std::string>& told = isChipFile ? page.chip : page.board;
    EXPECT_GT(told.size(), 70U);
    std::set<std::string> patterns;
    for (const std::string& key : told) {
      patterns.insert(KnownKeys::PatternOf(key));
      EXPECT_TRUE(known.IsKnown(key, isChipFile) || key == "chip.<chip>.data") << "nothing reads " << key;
    }
    for (const std::string& key : known.All(isChipFile)) {
      const bool isOfASection = key.starts_with("chip.") && page.chip.contains(key.substr(key.find('.', 5) + 1));
      const bool isData = key.starts_with("chip.") && key.ends_with(".data");
      EXPECT_TRUE(patterns.contains(KnownKeys::PatternOf(key)) || isOfASection || isData)
          << "the page does not have " << key;
    }
  }
}

}  // namespace
}  // namespace panelglow::boardtool
