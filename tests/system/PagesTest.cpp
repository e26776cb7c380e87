// The command blocks of the pages do what the pages say. A block in a fence of the language "sh" holds commands,
// which begin in the top folder of the source tree; "sh fails" marks one that shows a run that fails. Fences of any
// other language hold no commands, and no block is set by indentation.
#include <gmock/gmock.h>
#include <sys/wait.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <sstream>

#include "system/SystemRun.h"

namespace panelglow::systemtest {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;

namespace fs = std::filesystem;

const fs::path kTop = PANELGLOW_SOURCE_DIR;

struct Block {
  std::string page;
  std::string info;  // behind the fence's mark
  std::vector<std::string> commands;
};

// The blocks of a page; lines that end in a backslash are joined with their next ones.
std::vector<Block> BlocksOf(const fs::path& page) {
  std::vector<Block> blocks;
  bool inside = false;
  bool goesOn = false;
  std::istringstream lines(TextOf(page));
  for (std::string line; std::getline(lines, line);) {
    if (line.starts_with("```")) {
      inside = !inside;
      if (inside) {
        blocks.push_back({page.filename(), line.substr(3), {}});
      }
    } else if (inside) {
      std::vector<std::string>& commands = blocks.back().commands;
      const bool continues = goesOn && !commands.empty();
      goesOn = line.ends_with('\\');
      line.resize(line.size() - (goesOn ? 1 : 0));
      if (continues) {
        commands.back() += line;
      } else {
        commands.push_back(line);
      }
    } else if (line.starts_with("    ")) {
      blocks.push_back({page.filename(), "indented", {line}});
    }
  }
  return blocks;
}

std::vector<Block> AllBlocks() {
  std::vector<fs::path> pages{kTop / "README.md", kTop / "machines/README.md"};
  for (const fs::directory_entry& entry : fs::directory_iterator(kTop / "docs")) {
    if (entry.path().extension() == ".md") {
      pages.push_back(entry.path());
    }
  }
  std::vector<Block> all;
  for (const fs::path& page : pages) {
    const std::vector<Block> blocks = BlocksOf(page);
    all.insert(all.end(), blocks.begin(), blocks.end());
  }
  return all;
}

bool IsSetUp(const std::string& command) {
  return command.starts_with("./run") || command.starts_with("./test") || command.starts_with("tools/");
}

// What is not known to the program that a set-up command starts: its own file, or one of its options.
std::string UnknownIn(const std::string& command) {
  std::istringstream words(command);
  std::string word;
  words >> word;
  std::string known = TextOf(kTop / word);
  if (known.empty()) {
    return word;
  }
  if (word == "./run") {
    known += RunProgram("panelglow-sim", {"--help"}, fs::temp_directory_path(), {}).output;
  }
  while (words >> word && word != "--") {
    if (word.starts_with("--") && known.find(word) == std::string::npos) {
      return word;
    }
  }
  return {};
}

// A source tree as a reader of the pages has it, with the programs of this build.
class Tree {
 public:
  Tree() {
    fs::create_directories(root_.Path("build/release"));
    fs::create_symlink(PANELGLOW_BINARY_DIR, root_.Path("build/release/bin"));
    fs::create_symlink(kTop / "docs", root_.Path("docs"));
    fs::create_symlink(kTop / "machines", root_.Path("machines"));
    fs::copy(kTop / "installation", root_.Path("installation"));
  }

  /// The exit code of the commands, run one after the other up to the first that fails.
  [[nodiscard]] int Run(const std::vector<std::string>& commands, std::string& output) const {
    std::string script = "set -e\ncd '" + root_.Path("").string() + "'\n";
    for (const std::string& command : commands) {
      script += command + "\n";
    }
    root_.Write("block.sh", script);
    const int status = std::system(
        ("sh '" + root_.Path("block.sh").string() + "' </dev/null >'" + root_.Path("out.txt").string() + "' 2>&1")
            .c_str());
    output = root_.Read("out.txt");
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

 private:
  Installation root_;
};

TEST(SystemPages, EveryCommandBlockWorksFromTheTopFolder) {
  int blocks = 0;
  for (const Block& block : AllBlocks()) {
    SCOPED_TRACE(block.page + ": " + (block.commands.empty() ? "" : block.commands.front()));
    EXPECT_NE(block.info, "indented");
    EXPECT_NE(block.info, "") << "a fence without a language";
    if (block.info != "sh" && block.info != "sh fails") {
      continue;
    }
    ++blocks;
    std::vector<std::string> commands;
    for (const std::string& command : block.commands) {
      if (!IsSetUp(command)) {
        commands.push_back(command);
        continue;
      }
      EXPECT_EQ(UnknownIn(command), "") << command;
      // What ./run does once everything is built.
      if (command.starts_with("./run --machine") && command.find("--window") == std::string::npos) {
        commands.push_back("cd installation && ../build/release/bin/panelglow-sim " + command.substr(6));
      }
    }
    std::string output;
    EXPECT_EQ(Tree().Run(commands, output), block.info == "sh" ? 0 : 1) << output;
  }
  EXPECT_GE(blocks, 6);
}

Outcome Control(const Installation& installation, const std::string& person, const std::vector<std::string>& more) {
  std::vector<std::string> arguments = more;
  arguments.insert(arguments.end(), {(fs::path(PANELGLOW_BINARY_DIR) / "panelglow-diags-sim").string(),
                                     "-subtest=CustomLEDTest", "-SectionID=Notebook", "-Retries=0"});
  return RunProgram(
      (kTop / "docs/examples/controller.py").string(), arguments, installation.Path(""),
      {{"PANELGLOW_SIM_MACHINE", installation.Machine("notebook.toml")}, {"PANELGLOW_SIM_OPERATOR", person}});
}

TEST(SystemPages, TheControllerOfTheExamplesTellsEachVerdict) {
  const Installation installation;
  const std::tuple<const char*, int, const char*> kCases[] = {
      {"perfect", 0, "100 %\npassed\n"}, {"wrong:1", 1, "80 %\nfailed: 7710"}, {"silent", 1, "80 %\nfailed: 7710"}};
  for (const auto& [person, exitCode, end] : kCases) {
    installation.Write("kill.ctl", "");  // of an earlier run
    const Outcome outcome = Control(installation, person, {});
    EXPECT_EQ(outcome.exitCode, exitCode) << outcome.errors;
    EXPECT_THAT(outcome.output, HasSubstr(end));
  }
  const Outcome stopped = Control(installation, "perfect", {"--limit", "0"});
  EXPECT_EQ(stopped.exitCode, 1);
  EXPECT_THAT(stopped.output, HasSubstr("failed: 995000\n"));
  EXPECT_FALSE(fs::exists(installation.Path("kill.ctl")));
  EXPECT_EQ(
      RunProgram((kTop / "docs/examples/controller.py").string(), {"/bin/echo", "nothing"}, installation.Path(""), {})
          .exitCode,
      3);
}

}  // namespace
}  // namespace panelglow::systemtest
